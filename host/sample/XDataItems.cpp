#include "sample/XDataItems.h"

#include <charconv>
#include <cstdio>

namespace zvsample {

std::string realText(double value) {
    char buffer[64];
    const auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
    return std::string(buffer, result.ptr);
}

std::string handleText(std::uint64_t handle) {
    char buffer[24];
    std::snprintf(buffer, sizeof buffer, "%llX", static_cast<unsigned long long>(handle));
    return buffer;
}

XDataItems& XDataItems::add(int code, std::string value) {
    texts_.push_back(std::move(value));
    tags_.push_back(zvdb::Tag{static_cast<std::int16_t>(code), texts_.back()});
    return *this;
}

XDataItems& XDataItems::point(const zvdb::Point3& p, int code) {
    add(code, realText(p.x));
    add(code + 10, realText(p.y));
    return add(code + 20, realText(p.z));
}

}  // namespace zvsample
