#pragma once
// The binary form of a DXF file's tags (2-byte group codes, as from R13 on), so that every
// ASCII input of the fuzzer and every seed reaches the binary reader too. A value that does
// not parse as its code's number is written as 0: the result is still a file to read.
#include "drawing/Tag.h"

#include <charconv>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

namespace zvfuzz {

inline std::string_view trimmed(std::string_view text) {
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t'))
        text.remove_prefix(1);
    while (!text.empty() && (text.back() == ' ' || text.back() == '\t' || text.back() == '\r'))
        text.remove_suffix(1);
    return text;
}

template <typename T>
void appendNumber(std::string& out, T value) {
    char bytes[sizeof(T)];
    std::memcpy(bytes, &value, sizeof(T));
    out.append(bytes, sizeof(T));
}

template <typename T>
T parsed(std::string_view text) {
    text = trimmed(text);
    if (!text.empty() && text.front() == '+') text.remove_prefix(1);
    T value{};
    std::from_chars(text.data(), text.data() + text.size(), value);
    return value;
}

inline int hexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return 0;
}

inline std::string toBinaryDxf(const std::vector<zvdb::Tag>& tags) {
    std::string out("AutoCAD Binary DXF\r\n\x1a\0", 22);
    for (const zvdb::Tag& tag : tags) {
        if (tag.code == zvdb::kRemovedTag) continue;
        const std::string_view value = tag.value;
        switch (zvdb::valueKind(tag.code)) {
            case zvdb::ValueKind::Real:
                appendNumber(out, tag.code);
                appendNumber(out, parsed<double>(value));
                break;
            case zvdb::ValueKind::Int16:
                appendNumber(out, tag.code);
                appendNumber(out, static_cast<std::int16_t>(parsed<std::int32_t>(value)));
                break;
            case zvdb::ValueKind::Int32:
                appendNumber(out, tag.code);
                appendNumber(out, parsed<std::int32_t>(value));
                break;
            case zvdb::ValueKind::Int64:
                appendNumber(out, tag.code);
                appendNumber(out, parsed<std::int64_t>(value));
                break;
            case zvdb::ValueKind::Bool:
                appendNumber(out, tag.code);
                out.push_back(static_cast<char>(parsed<int>(value) != 0));
                break;
            case zvdb::ValueKind::Binary: {
                // Chunks of at most 127 bytes, each a tag of its own, as binary files hold them.
                const std::string_view hex = trimmed(value);
                std::size_t at = 0;
                do {
                    const std::size_t digits = std::min<std::size_t>(hex.size() - at, 254);
                    appendNumber(out, tag.code);
                    out.push_back(static_cast<char>(digits / 2));
                    for (std::size_t i = 0; i + 1 < digits; i += 2)
                        out.push_back(static_cast<char>(hexDigit(hex[at + i]) * 16 +
                                                        hexDigit(hex[at + i + 1])));
                    at += digits;
                } while (at + 1 < hex.size());
                break;
            }
            case zvdb::ValueKind::String:
            case zvdb::ValueKind::Handle:
                appendNumber(out, tag.code);
                out.append(value.substr(0, value.find('\0')));
                out.push_back('\0');
                break;
        }
    }
    return out;
}

}  // namespace zvfuzz
