#include "TagReader.h"

#include "DxfError.h"

#include <algorithm>
#include <charconv>
#include <cstring>

namespace zvdb {

namespace {

constexpr std::string_view kBinarySentinel("AutoCAD Binary DXF\r\n\x1a\0", 22);

std::string shown(std::string_view text) {
    std::string s(text.substr(0, 40));
    for (char& c : s)
        if (static_cast<unsigned char>(c) < 0x20) c = '?';
    return s;
}

// Parses a group code line ("  0", "1001", " 10\r"); false when it is not a number.
bool parseCode(const char* p, const char* end, int& code) {
    while (p < end && (*p == ' ' || *p == '\t'))
        ++p;
    bool negative = false;
    if (p < end && *p == '-') {
        negative = true;
        ++p;
    }
    if (p == end || *p < '0' || *p > '9') return false;
    int value = 0;
    while (p < end && *p >= '0' && *p <= '9') {
        value = value * 10 + (*p - '0');
        if (value > 32767) return false;
        ++p;
    }
    while (p < end && (*p == ' ' || *p == '\t' || *p == '\r'))
        ++p;
    if (p != end) return false;
    code = negative ? -value : value;
    return true;
}

bool onlyWhitespace(const char* p, const char* end) {
    for (; p < end; ++p)
        if (*p != ' ' && *p != '\t' && *p != '\r' && *p != '\n' && *p != '\0') return false;
    return true;
}

class BinaryCursor {
public:
    BinaryCursor(std::string_view data, StringArena& arena) : data_(data), arena_(arena) {}
    bool atEnd() const { return pos_ >= data_.size(); }
    std::size_t offset() const { return pos_; }

    const unsigned char* take(std::size_t n) {
        if (data_.size() - pos_ < n)
            throw DxfError("byte " + std::to_string(pos_) + ": the file ends inside a value");
        const auto* p = reinterpret_cast<const unsigned char*>(data_.data() + pos_);
        pos_ += n;
        return p;
    }
    template <typename T>
    T number() {
        T value;
        std::memcpy(&value, take(sizeof(T)), sizeof(T));
        return value;
    }
    std::string_view cString() {
        const void* zero = std::memchr(data_.data() + pos_, 0, data_.size() - pos_);
        if (!zero) throw DxfError("byte " + std::to_string(pos_) + ": the file ends inside a text");
        const auto* z = static_cast<const char*>(zero);
        std::string_view text(data_.data() + pos_,
                              static_cast<std::size_t>(z - data_.data()) - pos_);
        // A line break would split the value in two lines of the DXF text we write.
        if (text.find('\n') != std::string_view::npos)
            throw DxfError("byte " + std::to_string(pos_ + kBinarySentinel.size()) +
                           ": a text holds a line break");
        pos_ += text.size() + 1;
        return text;
    }
    template <typename T>
    std::string_view asText(T value) {
        char buffer[40];
        auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
        return arena_.store(
            std::string_view(buffer, static_cast<std::size_t>(result.ptr - buffer)));
    }
    std::string_view hex(std::size_t n) {
        static const char kDigits[] = "0123456789ABCDEF";
        const unsigned char* p = take(n);
        std::string text(n * 2, '0');
        for (std::size_t i = 0; i < n; ++i) {
            text[2 * i] = kDigits[p[i] >> 4];
            text[2 * i + 1] = kDigits[p[i] & 15];
        }
        return arena_.store(text);
    }

private:
    std::string_view data_;
    StringArena& arena_;
    std::size_t pos_ = 0;
};

std::string_view binaryValue(BinaryCursor& in, int code, bool shortCodes) {
    switch (valueKind(code)) {
        case ValueKind::Real:
            return in.asText(in.number<double>());
        case ValueKind::Int16:
            return in.asText(in.number<std::int16_t>());
        case ValueKind::Int32:
            return in.asText(in.number<std::int32_t>());
        case ValueKind::Int64:
            return in.asText(in.number<std::int64_t>());
        case ValueKind::Bool:
            return in.asText(static_cast<int>(*in.take(1)));
        case ValueKind::Binary:
            return in.hex(*in.take(1));
        case ValueKind::String:
        case ValueKind::Handle:
            // R12 binary files store 1-byte codes and 2-byte integers for 70-78 alike.
            (void)shortCodes;
            return in.cString();
    }
    return {};
}

}  // namespace

bool TagReader::isBinary(std::string_view data) {
    return data.size() >= kBinarySentinel.size() &&
           data.substr(0, kBinarySentinel.size()) == kBinarySentinel;
}

namespace {
constexpr int kComment = 999;

bool isEof(const Tag& tag) {
    return tag.code == 0 && tag.value == "EOF";
}
}  // namespace

std::vector<Tag> TagReader::readAscii(std::string_view text, std::vector<std::size_t>* comments) {
    std::vector<Tag> tags;
    tags.reserve(static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n')) / 2 + 2);
    const char* p = text.data();
    const char* end = p + text.size();
    if (text.size() >= 3 && std::memcmp(p, "\xEF\xBB\xBF", 3) == 0) p += 3;
    std::size_t line = 1;
    while (p < end) {
        const char* nl = static_cast<const char*>(std::memchr(p, '\n', end - p));
        const char* codeEnd = nl ? nl : end;
        int code = 0;
        if (!parseCode(p, codeEnd, code)) {
            if (onlyWhitespace(p, end)) break;
            throw DxfError("line " + std::to_string(line) + ": expected a group code, found '" +
                           shown(std::string_view(p, codeEnd - p)) + "'");
        }
        if (!nl || nl + 1 >= end)
            throw DxfError("line " + std::to_string(line + 1) +
                           ": the file ends after group code " + std::to_string(code) +
                           "; its value is missing");
        p = nl + 1;
        const char* vnl = static_cast<const char*>(std::memchr(p, '\n', end - p));
        const char* valueEnd = vnl ? vnl : end;
        const char* trimmed = valueEnd;
        if (trimmed > p && trimmed[-1] == '\r') --trimmed;
        const Tag tag{static_cast<std::int16_t>(code), std::string_view(p, trimmed - p)};
        p = vnl ? vnl + 1 : end;
        line += 2;
        if (code == kComment) {
            if (comments) comments->push_back(tags.size());
            continue;
        }
        tags.push_back(tag);
        // What follows the end of the file is not part of the drawing.
        if (isEof(tag)) break;
    }
    return tags;
}

std::vector<Tag> TagReader::readBinary(std::string_view data, StringArena& arena,
                                       std::vector<std::size_t>* comments) {
    std::vector<Tag> tags;
    tags.reserve(data.size() / 10 + 16);
    BinaryCursor in(data.substr(kBinarySentinel.size()), arena);
    // Files from R13 on store 2-byte group codes; R12 files 1 byte (255 escapes a 2-byte one).
    const std::string_view body = data.substr(kBinarySentinel.size());
    const bool shortCodes = body.size() > 2 && body[0] == 0 && body[1] != 0;
    while (!in.atEnd()) {
        int code;
        if (shortCodes) {
            code = *in.take(1);
            if (code == 255) code = in.number<std::int16_t>();
        } else {
            code = in.number<std::int16_t>();
        }
        if (code < -5 || code > 1071)
            throw DxfError("byte " + std::to_string(in.offset() + kBinarySentinel.size()) +
                           ": expected a group code, found " + std::to_string(code));
        const std::string_view value = binaryValue(in, code, shortCodes);
        if (code == kComment) {
            if (comments) comments->push_back(tags.size());
            continue;
        }
        tags.push_back(Tag{static_cast<std::int16_t>(code), value});
        if (isEof(tags.back())) break;
    }
    return tags;
}

}  // namespace zvdb
