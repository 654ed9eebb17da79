#pragma once
// Text encodings of drawing files: the code pages of files before R2007 (with the \U+XXXX
// and \M+NXXXX escapes for characters outside the code page) and UTF-8 from R2007.
#include <string>
#include <string_view>

namespace zvdb {

class TextCodec {
public:
    // A $DWGCODEPAGE value ("ANSI_1252", "ANSI_932", ...) as a known code page; false when
    // the name is not one we can convert.
    static bool isKnownCodePage(std::string_view dwgCodePage);
    static bool isAscii(std::string_view bytes);
    static bool isValidUtf8(std::string_view bytes);
    // Bytes in the code page to UTF-8.
    static std::string toUtf8(std::string_view bytes, std::string_view dwgCodePage);
    // UTF-8 to the code page; a character the code page lacks becomes \U+XXXX.
    static std::string fromUtf8(std::string_view utf8, std::string_view dwgCodePage);
    // Replaces \U+XXXX and \M+NXXXX escapes by the characters (UTF-8); false when there was
    // none, and `out` is then untouched.
    static bool decodeEscapes(std::string_view text, std::string& out);
};

}  // namespace zvdb
