#pragma once
// A drawing file that can't be read or written: the message names the line and what was
// expected there.
#include <stdexcept>
#include <string>

namespace zvdb {

class DxfError : public std::runtime_error {
public:
    explicit DxfError(const std::string& message) : std::runtime_error(message) {}
};

}  // namespace zvdb
