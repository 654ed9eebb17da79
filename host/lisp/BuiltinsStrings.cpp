// Strings (UTF-16 code units as characters), conversions, wcmatch and the number formats.
#include "Builtins.h"
#include "Interpreter.h"
#include "NumberFormat.h"
#include "Reader.h"
#include "Wildcard.h"

namespace zvlisp {

namespace {

int optionalInt(Interpreter& in, Args a, int index, int fallback) {
    return a.has(index) && !a[index].isNil() ? in.toInt(a[index]) : fallback;
}

Value substr(Interpreter& in, Args a) {
    const QString& text = in.toStr(a[0]);
    const std::int32_t start = in.toInt(a[1]);
    if (start < 1) in.fail("bad argument value: positive " + QString::number(start));
    if (a.has(2) && !a[2].isNil() && in.toInt(a[2]) < 0)
        in.fail("bad argument value: non-negative " + QString::number(a[2].asInt()));
    const int length = a.has(2) && !a[2].isNil() ? a[2].asInt() : -1;
    return Value::string(text.mid(start - 1, length));
}

// Leading blanks, a sign and digits, as C's atoi; anything else ends the number.
Value atoi(Interpreter& in, Args a) {
    const QString& text = in.toStr(a[0]);
    int i = 0;
    while (i < text.size() && text[i].isSpace())
        ++i;
    bool negative = false;
    if (i < text.size() && (text[i] == '-' || text[i] == '+')) negative = text[i++] == '-';
    std::uint32_t value = 0;
    for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i)
        value = value * 10 + std::uint32_t(text[i].unicode() - '0');
    return Value::integer(std::int32_t(negative ? 0u - value : value));
}

// The longest leading number, as C's atof; 0.0 when there is none.
Value atof(Interpreter& in, Args a) {
    const QString& text = in.toStr(a[0]);
    int i = 0;
    while (i < text.size() && text[i].isSpace())
        ++i;
    const int start = i;
    auto digits = [&] {
        const int from = i;
        while (i < text.size() && text[i] >= '0' && text[i] <= '9')
            ++i;
        return i - from;
    };
    if (i < text.size() && (text[i] == '-' || text[i] == '+')) ++i;
    int count = digits();
    if (i < text.size() && text[i] == '.') {
        ++i;
        count += digits();
    }
    if (count == 0) return Value::real(0.0);
    int end = i;
    if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
        ++i;
        if (i < text.size() && (text[i] == '-' || text[i] == '+')) ++i;
        if (digits() > 0) end = i;
    }
    return Value::real(text.mid(start, end - start).toDouble());
}

Value chr(Interpreter& in, Args a) {
    const std::int32_t code = in.toInt(a[0]);
    if (code == 0) return Value::string(QString());
    if (code < 0 || code > 0x10FFFF) in.fail("bad argument value: " + QString::number(code));
    const char32_t c = char32_t(code);
    return Value::string(QString::fromUcs4(&c, 1));
}

Value ascii(Interpreter& in, Args a) {
    const QString& text = in.toStr(a[0]);
    if (text.isEmpty()) return Value::integer(0);
    if (text.size() > 1 && text[0].isHighSurrogate() && text[1].isLowSurrogate())
        return Value::integer(std::int32_t(QChar::surrogateToUcs4(text[0], text[1])));
    return Value::integer(text[0].unicode());
}

Value search(Interpreter& in, Args a) {
    const QString& pattern = in.toStr(a[0]);
    const QString& text = in.toStr(a[1]);
    const int start = optionalInt(in, a, 2, 0);
    const int at = start > text.size() ? -1 : text.indexOf(pattern, std::max(0, start));
    return at < 0 ? Value() : Value::integer(at);
}

Value substitute(Interpreter& in, Args a) {
    const QString& replacement = in.toStr(a[0]);
    const QString& pattern = in.toStr(a[1]);
    QString text = in.toStr(a[2]);
    const int start = optionalInt(in, a, 3, 0);
    const int at = start > text.size() ? -1 : text.indexOf(pattern, std::max(0, start));
    if (at < 0) return Value::string(text);
    in.checkLength(qint64(text.size()) + replacement.size(), "vl-string-subst");
    text.replace(at, pattern.size(), replacement);
    return Value::string(text);
}

Value trim(Interpreter& in, Args a, bool left, bool right) {
    const QString& set = in.toStr(a[0]);
    const QString& text = in.toStr(a[1]);
    int from = 0, to = text.size();
    while (left && from < to && set.contains(text[from]))
        ++from;
    while (right && to > from && set.contains(text[to - 1]))
        --to;
    return Value::string(text.mid(from, to - from));
}

Value translate(Interpreter& in, Args a) {
    const QString& from = in.toStr(a[0]);
    const QString& to = in.toStr(a[1]);
    QString text = in.toStr(a[2]);
    for (QChar& c : text) {
        const int i = from.indexOf(c);
        if (i >= 0 && i < to.size()) c = to[i];
    }
    return Value::string(text);
}

Value position(Interpreter& in, Args a) {
    const QChar code(char16_t(in.toInt(a[0])));
    const QString& text = in.toStr(a[1]);
    const bool fromEnd = a.has(3) && !a[3].isNil();
    const int start = optionalInt(in, a, 2, fromEnd ? text.size() - 1 : 0);
    const int at = fromEnd ? text.lastIndexOf(code, std::min(start, int(text.size()) - 1))
                           : text.indexOf(code, std::max(0, start));
    return at < 0 ? Value() : Value::integer(at);
}

// Names of drawing tables: no control characters nor < > / \ " : ; ? * | , = `; a "|" only
// inside the name when the flag allows it.
Value snvalid(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const bool bar = optionalInt(in, a, 1, 0) == 1;
    if (name.isEmpty() || name.size() > 255) return Value();
    static const QString forbidden = QStringLiteral("<>/\\\":;?*,=`");
    for (int i = 0; i < name.size(); ++i) {
        const QChar c = name[i];
        if (c.unicode() < 32 || forbidden.contains(c)) return Value();
        if (c == '|' && (!bar || i == 0 || i == name.size() - 1)) return Value();
    }
    return in.t();
}

void defineBasics(Interpreter& in) {
    in.define("strcat", [](Interpreter& in, Args a) {
        qint64 length = 0;
        for (const Value& v : a)
            length += in.toStr(v).size();
        in.checkLength(length, "strcat");
        QString text;
        text.reserve(int(length));
        for (const Value& v : a)
            text += in.toStr(v);
        return Value::string(text);
    });
    in.define("strlen", [](Interpreter& in, Args a) {
        std::int32_t n = 0;
        for (const Value& v : a)
            n += std::int32_t(in.toStr(v).size());
        return Value::integer(n);
    });
    in.define("substr", substr, 2, 3);
    in.define(
        "strcase",
        [](Interpreter& in, Args a) {
            const QString& text = in.toStr(a[0]);
            return Value::string(a.has(1) && !a[1].isNil() ? text.toLower() : text.toUpper());
        },
        1, 2);
    in.define("ascii", ascii, 1, 1);
    in.define("chr", chr, 1, 1);
    in.define(
        "wcmatch",
        [](Interpreter& in, Args a) {
            const QString& text = in.toStr(a[0]);
            return in.boolean(Wildcard(in.toStr(a[1])).matches(text));
        },
        2, 2);
    in.define("snvalid", snvalid, 1, 2);
}

void defineConversions(Interpreter& in) {
    in.define(
        "itoa",
        [](Interpreter& in, Args a) { return Value::string(QString::number(in.toInt(a[0]))); }, 1,
        1);
    in.define("atoi", atoi, 1, 1);
    in.define("atof", atof, 1, 1);
    in.define(
        "rtos",
        [](Interpreter& in, Args a) {
            const double value = in.toNumber(a[0]);
            const int mode = optionalInt(in, a, 1, in.units.lunits);
            const int precision = optionalInt(in, a, 2, in.units.luprec);
            const QString text = NumberFormat::linear(value, mode, precision, in.units.dimzin);
            if (text.isEmpty()) in.fail("bad argument value: " + QString::number(mode));
            return Value::string(text);
        },
        1, 3);
    in.define(
        "distof",
        [](Interpreter& in, Args a) {
            optionalInt(in, a, 1, 0);
            const std::optional<double> value = NumberFormat::parseLinear(in.toStr(a[0]));
            return value ? Value::real(*value) : Value();
        },
        1, 2);
    in.define(
        "angtos",
        [](Interpreter& in, Args a) {
            const double value = in.toNumber(a[0]);
            const int mode = optionalInt(in, a, 1, in.units.aunits);
            const int precision = optionalInt(in, a, 2, in.units.auprec);
            const QString text = NumberFormat::angle(value, mode, precision);
            if (text.isEmpty()) in.fail("bad argument value: " + QString::number(mode));
            return Value::string(text);
        },
        1, 3);
}

void defineVlStrings(Interpreter& in) {
    in.define("vl-string-search", search, 2, 3);
    in.define("vl-string-subst", substitute, 3, 4);
    in.define(
        "vl-string-trim", [](Interpreter& in, Args a) { return trim(in, a, true, true); }, 2, 2);
    in.define(
        "vl-string-left-trim", [](Interpreter& in, Args a) { return trim(in, a, true, false); }, 2,
        2);
    in.define(
        "vl-string-right-trim", [](Interpreter& in, Args a) { return trim(in, a, false, true); }, 2,
        2);
    in.define("vl-string-translate", translate, 3, 3);
    in.define("vl-string-position", position, 2, 4);
    in.define(
        "vl-string->list",
        [](Interpreter& in, Args a) {
            ListBuilder list;
            for (QChar c : in.toStr(a[0]))
                list.add(Value::integer(c.unicode()));
            return list.take();
        },
        1, 1);
    in.define(
        "vl-list->string",
        [](Interpreter& in, Args a) {
            QString text;
            for (const Value& code : in.toVector(a[0]))
                text += QChar(char16_t(in.toInt(code)));
            return Value::string(text);
        },
        1, 1);
    in.define(
        "vl-string-elt",
        [](Interpreter& in, Args a) {
            const QString& text = in.toStr(a[0]);
            const std::int32_t i = in.toInt(a[1]);
            if (i < 0 || i >= text.size()) in.fail("bad argument value: " + QString::number(i));
            return Value::integer(text[i].unicode());
        },
        2, 2);
}

}  // namespace

void registerStringBuiltins(Interpreter& in) {
    defineBasics(in);
    defineConversions(in);
    defineVlStrings(in);
}

}  // namespace zvlisp
