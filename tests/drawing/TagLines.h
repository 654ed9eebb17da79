#pragma once
// An object's tags as "code value" lines: what a test compares when two ways of making or
// reading an object must give the same tags.
#include "drawing/DbObject.h"

#include <string>
#include <vector>

namespace zvdb {

inline std::vector<std::string> lines(const DbObject& object) {
    std::vector<std::string> all;
    for (const Tag& tag : object.tags())
        all.push_back(std::to_string(tag.code) + " " + std::string(tag.value));
    return all;
}

}  // namespace zvdb
