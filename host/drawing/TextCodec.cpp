#include "TextCodec.h"

#include <QByteArray>
#include <QHash>
#include <QString>
#include <QTextCodec>

#include <cstdint>
#include <cstdio>
#include <cstring>

namespace zvdb {

namespace {

// The codec behind a $DWGCODEPAGE name, or null.
QTextCodec* codecFor(std::string_view dwgCodePage) {
    std::string name(dwgCodePage);
    for (char& c : name)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    if (name.rfind("ANSI_", 0) == 0) name = name.substr(5);
    if (name.empty()) name = "1252";
    const char* qtName = nullptr;
    if (name == "932" || name == "DOS932")
        qtName = "Shift_JIS";
    else if (name == "936")
        qtName = "GBK";
    else if (name == "949")
        qtName = "windows-949";
    else if (name == "950")
        qtName = "Big5";
    else if (name == "874")
        qtName = "windows-874";
    else if (name == "1361")
        qtName = "windows-949";
    else if (name == "UTF8" || name == "UTF-8")
        qtName = "UTF-8";
    else if (name.size() == 4 && name.rfind("125", 0) == 0)
        name = "windows-" + name;
    else if (name.rfind("ISO8859_", 0) == 0)
        name = "ISO-8859-" + name.substr(8);
    else if (name.rfind("DOS", 0) == 0)
        name = "IBM" + name.substr(3);
    QTextCodec* codec = QTextCodec::codecForName(qtName ? qtName : name.c_str());
    if (!codec && qtName && std::strcmp(qtName, "windows-949") == 0)
        codec = QTextCodec::codecForName("cp949");
    return codec;
}

void appendUtf8(std::string& out, char32_t cp) {
    if (cp < 0x80) {
        out += static_cast<char>(cp);
    } else if (cp < 0x800) {
        out += static_cast<char>(0xC0 | (cp >> 6));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else if (cp < 0x10000) {
        out += static_cast<char>(0xE0 | (cp >> 12));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (cp >> 18));
        out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    }
}

bool hexValue(std::string_view text, std::size_t at, std::size_t count, unsigned& value) {
    if (at + count > text.size()) return false;
    value = 0;
    for (std::size_t i = at; i < at + count; ++i) {
        const char c = text[i];
        unsigned digit;
        if (c >= '0' && c <= '9')
            digit = c - '0';
        else if (c >= 'A' && c <= 'F')
            digit = c - 'A' + 10;
        else if (c >= 'a' && c <= 'f')
            digit = c - 'a' + 10;
        else
            return false;
        value = value * 16 + digit;
    }
    return true;
}

const char* multiByteCodePage(char index) {
    switch (index) {
        case '1':
            return "932";
        case '2':
            return "950";
        case '3':
            return "949";
        case '4':
            return "1361";
        case '5':
            return "936";
        default:
            return nullptr;
    }
}

}  // namespace

bool TextCodec::isKnownCodePage(std::string_view dwgCodePage) {
    return codecFor(dwgCodePage) != nullptr;
}

bool TextCodec::isAscii(std::string_view bytes) {
    const char* p = bytes.data();
    std::size_t n = bytes.size();
    // Eight bytes at a time: any high bit means a byte above 0x7F.
    std::uint64_t any = 0;
    for (; n >= 8; p += 8, n -= 8) {
        std::uint64_t word;
        std::memcpy(&word, p, 8);
        any |= word;
    }
    for (; n; ++p, --n)
        any |= static_cast<unsigned char>(*p);
    return (any & 0x8080808080808080ULL) == 0;
}

bool TextCodec::isValidUtf8(std::string_view bytes) {
    const auto* p = reinterpret_cast<const unsigned char*>(bytes.data());
    const auto* end = p + bytes.size();
    while (p < end) {
        if (*p < 0x80) {
            ++p;
            continue;
        }
        int extra;
        if ((*p & 0xE0) == 0xC0 && *p >= 0xC2)
            extra = 1;
        else if ((*p & 0xF0) == 0xE0)
            extra = 2;
        else if ((*p & 0xF8) == 0xF0 && *p <= 0xF4)
            extra = 3;
        else
            return false;
        if (end - p <= extra) return false;
        for (int i = 1; i <= extra; ++i)
            if ((p[i] & 0xC0) != 0x80) return false;
        p += extra + 1;
    }
    return true;
}

std::string TextCodec::toUtf8(std::string_view bytes, std::string_view dwgCodePage) {
    QTextCodec* codec = codecFor(dwgCodePage);
    if (!codec) codec = codecFor("ANSI_1252");
    const QString text = codec->toUnicode(bytes.data(), static_cast<int>(bytes.size()));
    const QByteArray utf8 = text.toUtf8();
    return std::string(utf8.constData(), static_cast<std::size_t>(utf8.size()));
}

std::string TextCodec::fromUtf8(std::string_view utf8, std::string_view dwgCodePage) {
    QTextCodec* codec = codecFor(dwgCodePage);
    if (!codec) codec = codecFor("ANSI_1252");
    const QString text = QString::fromUtf8(utf8.data(), static_cast<int>(utf8.size()));
    std::string out;
    out.reserve(utf8.size());
    const auto ucs4 = text.toUcs4();
    for (uint cp : ucs4) {
        if (cp < 0x80) {
            out += static_cast<char>(cp);
            continue;
        }
        const QString one = QString::fromUcs4(reinterpret_cast<const char32_t*>(&cp), 1);
        if (cp < 0x10000 && codec->canEncode(one)) {
            const QByteArray bytes = codec->fromUnicode(one);
            out.append(bytes.constData(), static_cast<std::size_t>(bytes.size()));
        } else {
            char escape[16];
            std::snprintf(escape, sizeof escape, "\\U+%04X", cp);
            out += escape;
        }
    }
    return out;
}

bool TextCodec::decodeEscapes(std::string_view text, std::string& out) {
    if (text.find("\\U+") == std::string_view::npos && text.find("\\M+") == std::string_view::npos)
        return false;
    std::string result;
    result.reserve(text.size());
    for (std::size_t i = 0; i < text.size();) {
        unsigned value = 0;
        if (text.compare(i, 3, "\\U+") == 0 && hexValue(text, i + 3, 4, value)) {
            appendUtf8(result, value);
            i += 7;
            continue;
        }
        if (text.compare(i, 3, "\\M+") == 0 && i + 3 < text.size() &&
            multiByteCodePage(text[i + 3]) && hexValue(text, i + 4, 4, value)) {
            const char bytes[2] = {static_cast<char>(value >> 8), static_cast<char>(value & 0xFF)};
            result += toUtf8(std::string_view(bytes, 2), multiByteCodePage(text[i + 3]));
            i += 8;
            continue;
        }
        result += text[i++];
    }
    out = std::move(result);
    return true;
}

}  // namespace zvdb
