#pragma once
// An XRECORD object: a list of tags that the program gives meaning to.
#include "DbObject.h"

namespace zvdb {

class XRecord : public DbObject {
public:
    using DbObject::DbObject;
    // The data tags (after the subclass marker and its cloning flag).
    std::vector<Tag> data() const;
    void setData(std::span<const Tag> data);

private:
    std::size_t dataStart() const;
};

}  // namespace zvdb
