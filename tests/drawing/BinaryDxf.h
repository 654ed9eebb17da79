#pragma once
// Binary DXF from the text of an ASCII DXF file, for tests and the fuzzer: the same groups,
// each value stored as the group code's kind asks (R12 files with one-byte group codes).
#include "drawing/StringArena.h"
#include "drawing/Tag.h"
#include "drawing/TagReader.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

namespace zvtest {

inline std::string binaryDxf(std::string_view ascii) {
    const std::vector<zvdb::Tag> tags = zvdb::TagReader::readAscii(ascii);
    bool r12 = false;
    for (std::size_t i = 0; i + 1 < tags.size() && i < 64; ++i)
        if (tags[i].code == 9 && tags[i].value == "$ACADVER") r12 = tags[i + 1].value < "AC1012";
    std::string out("AutoCAD Binary DXF\r\n\x1a\0", 22);
    auto raw = [&](const auto& value) {
        out.append(reinterpret_cast<const char*>(&value), sizeof value);
    };
    for (const zvdb::Tag& tag : tags) {
        if (r12 && tag.code >= 0 && tag.code < 255) {
            out += static_cast<char>(tag.code);
        } else {
            if (r12) out += '\xff';
            raw(static_cast<std::int16_t>(tag.code));
        }
        const std::string value(tag.value);
        switch (zvdb::valueKind(tag.code)) {
            case zvdb::ValueKind::Real:
                raw(std::strtod(value.c_str(), nullptr));
                break;
            case zvdb::ValueKind::Int16:
                raw(static_cast<std::int16_t>(std::strtol(value.c_str(), nullptr, 10)));
                break;
            case zvdb::ValueKind::Int32:
                raw(static_cast<std::int32_t>(std::strtol(value.c_str(), nullptr, 10)));
                break;
            case zvdb::ValueKind::Int64:
                raw(static_cast<std::int64_t>(std::strtoll(value.c_str(), nullptr, 10)));
                break;
            case zvdb::ValueKind::Bool:
                out += static_cast<char>(std::strtol(value.c_str(), nullptr, 10) != 0);
                break;
            case zvdb::ValueKind::Binary: {
                const std::size_t n = std::min<std::size_t>(value.size() / 2, 127);
                out += static_cast<char>(n);
                for (std::size_t i = 0; i < n; ++i)
                    out +=
                        static_cast<char>(std::strtol(value.substr(2 * i, 2).c_str(), nullptr, 16));
                break;
            }
            case zvdb::ValueKind::String:
            case zvdb::ValueKind::Handle:
                out.append(value.c_str(), value.size() + 1);
                break;
        }
    }
    return out;
}

}  // namespace zvtest
