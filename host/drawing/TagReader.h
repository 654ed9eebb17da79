#pragma once
// Splits the bytes of a DXF file into tags, ASCII or binary. Values of ASCII files are
// views into the file's text; binary values are converted to text in the arena.
#include "StringArena.h"
#include "Tag.h"

#include <string>
#include <string_view>
#include <vector>

namespace zvdb {

class TagReader {
public:
    static bool isBinary(std::string_view data);
    // Throws DxfError naming the line (ASCII) or the byte offset (binary) at fault.
    static std::vector<Tag> readAscii(std::string_view text);
    static std::vector<Tag> readBinary(std::string_view data, StringArena& arena);
};

}  // namespace zvdb
