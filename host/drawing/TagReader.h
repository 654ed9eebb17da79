#pragma once
// Splits the bytes of a DXF file into tags, ASCII or binary. Values of ASCII files are
// views into the file's text; binary values are converted to text in the arena. Comments
// (group 999) are left out wherever they stand, and nothing after 0/EOF is read.
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
    // `comments`, when given, receives for each comment left out the index of the tag
    // that followed it, so that a tag's place in the file can be told again.
    static std::vector<Tag> readAscii(std::string_view text,
                                      std::vector<std::size_t>* comments = nullptr);
    static std::vector<Tag> readBinary(std::string_view data, StringArena& arena,
                                       std::vector<std::size_t>* comments = nullptr);
};

}  // namespace zvdb
