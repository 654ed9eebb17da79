#pragma once
// One DXF group: a group code and its value as text. Values are views into storage that the
// owning database keeps for its whole life (the file buffer or its string arena).
#include <cstdint>
#include <string_view>

namespace zvdb {

struct Tag {
    std::int16_t code = 0;
    std::string_view value;
    friend bool operator==(const Tag& a, const Tag& b) {
        return a.code == b.code && a.value == b.value;
    }
};

// How a group code's value is stored in binary DXF.
// The code of a tag that was taken out of an object and is no longer written.
inline constexpr std::int16_t kRemovedTag = -32768;

enum class ValueKind { String, Real, Int16, Int32, Int64, Bool, Binary, Handle };

ValueKind valueKind(int code);
// Codes whose value is the handle of another object (owners, pointers, xdata handles).
bool isPointerCode(int code);
// Codes whose value is text that may need code-page conversion and escapes.
inline bool isTextCode(int code) {
    return valueKind(code) == ValueKind::String;
}

}  // namespace zvdb
