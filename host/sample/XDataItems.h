#pragma once
// Builds the items of one extended-data group (or an Xrecord's data) from owned texts, so a
// caller can write `items.text(k).handle(h).point(p)` and hand the tags to the drawing.
#include <cstdint>
#include <deque>
#include <span>
#include <string>
#include <string_view>
#include <vector>
#include "drawing/Geometry.h"
#include "drawing/Tag.h"

namespace zvsample {

// The field separator of key texts and name-value texts.
inline constexpr char kSep = '\f';

// Shortest text of a real that reads back to the same value.
std::string realText(double value);
// Upper-case hexadecimal, no leading zeros.
std::string handleText(std::uint64_t handle);

class XDataItems {
public:
    XDataItems& add(int code, std::string value);
    XDataItems& text(std::string value) { return add(1000, std::move(value)); }
    XDataItems& handle(std::uint64_t h) { return text(handleText(h)); }
    XDataItems& integer32(long value) { return add(1071, std::to_string(value)); }
    XDataItems& point(const zvdb::Point3& p, int code = 1010);
    std::span<const zvdb::Tag> tags() const { return tags_; }

private:
    std::deque<std::string> texts_;
    std::vector<zvdb::Tag> tags_;
};

}  // namespace zvsample
