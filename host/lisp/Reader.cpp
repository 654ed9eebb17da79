#include "Reader.h"

#include "SymbolTable.h"

namespace zvlisp {

namespace {

// Deeper nesting than this is no program a person wrote.
constexpr int kMaxNesting = 1000;

bool isDelimiter(QChar c) {
    return c.isSpace() || c == '(' || c == ')' || c == '\'' || c == '"' || c == ';';
}

bool allDigits(const QString& s, int from, int to) {
    if (from >= to) return false;
    for (int i = from; i < to; ++i)
        if (s[i] < '0' || s[i] > '9') return false;
    return true;
}

}  // namespace

Reader::Reader(SymbolTable& symbols, const QString& text, const QString& file)
    : symbols_(symbols), text_(text), file_(file) {}

bool Reader::parseNumber(const QString& token, Value& number) {
    const int n = token.size();
    int start = (n > 0 && (token[0] == '+' || token[0] == '-')) ? 1 : 0;
    if (allDigits(token, start, n)) {
        bool ok = false;
        const qlonglong value = token.toLongLong(&ok);
        if (ok && value >= INT32_MIN && value <= INT32_MAX)
            number = Value::integer(std::int32_t(value));
        else
            number = Value::real(token.toDouble());
        return true;
    }
    // [sign] digits [. digits] [e [sign] digits], with digits on at least one side of "."
    int i = start;
    int intDigits = 0, fracDigits = 0;
    while (i < n && token[i].isDigit() && token[i] < 128)
        ++i, ++intDigits;
    if (i < n && token[i] == '.') {
        ++i;
        while (i < n && token[i].isDigit() && token[i] < 128)
            ++i, ++fracDigits;
    }
    if (intDigits + fracDigits == 0) return false;
    if (i < n && (token[i] == 'e' || token[i] == 'E')) {
        int e = i + 1;
        if (e < n && (token[e] == '+' || token[e] == '-')) ++e;
        if (!allDigits(token, e, n)) return false;
        i = n;
    }
    if (i != n) return false;
    bool ok = false;
    const double value = token.toDouble(&ok);
    if (!ok) return false;
    number = Value::real(value);
    return true;
}

void Reader::fail(const QString& message, bool atEnd) {
    incomplete_ = atEnd;
    LispError error(message);
    error.file = file_;
    error.line = line_;
    error.incompleteInput = atEnd;
    throw error;
}

void Reader::skipBlanks() {
    while (!atEnd()) {
        const QChar c = peek();
        if (c == '\n') {
            ++line_;
            ++pos_;
        } else if (c.isSpace()) {
            ++pos_;
        } else if (c == ';' && pos_ + 1 < text_.size() && text_[pos_ + 1] == '|') {
            pos_ += 2;
            for (;;) {
                if (atEnd()) fail("malformed comment on input", true);
                if (peek() == '|' && pos_ + 1 < text_.size() && text_[pos_ + 1] == ';') break;
                if (peek() == '\n') ++line_;
                ++pos_;
            }
            pos_ += 2;
        } else if (c == ';') {
            while (!atEnd() && peek() != '\n')
                ++pos_;
        } else {
            return;
        }
    }
}

bool Reader::next(Value& form) {
    skipBlanks();
    if (atEnd()) return false;
    formLine_ = line_;
    if (peek() == ')') {
        ++pos_;
        fail("extra right paren on input");
    }
    form = readForm(0);
    return true;
}

Value Reader::readForm(int depth) {
    skipBlanks();
    if (atEnd()) fail("malformed list on input", true);
    const QChar c = peek();
    if (c == '(') {
        ++pos_;
        return readList(depth + 1);
    }
    if (c == '\'') {
        ++pos_;
        if (depth >= kMaxNesting) fail("nesting too deep on input");
        Value quoted = readForm(depth + 1);
        return Value::cons(Value::symbol(symbols_.intern("QUOTE")),
                           Value::cons(std::move(quoted), Value()));
    }
    if (c == '"') return readString();
    if (c == ')') fail("misplaced right paren on input");
    return readAtom();
}

Value Reader::readList(int depth) {
    if (depth > kMaxNesting) fail("nesting too deep on input");
    ListBuilder list;
    for (;;) {
        skipBlanks();
        if (atEnd()) fail("malformed list on input", true);
        if (peek() == ')') {
            ++pos_;
            return list.take();
        }
        const bool dot =
            peek() == '.' && (pos_ + 1 >= text_.size() || isDelimiter(text_[pos_ + 1]));
        if (!dot) {
            list.add(readForm(depth));
            continue;
        }
        ++pos_;
        if (list.empty()) fail("misplaced dot on input");
        list.setTail(readForm(depth));
        skipBlanks();
        if (atEnd()) fail("malformed list on input", true);
        if (peek() != ')') fail("misplaced dot on input");
        ++pos_;
        return list.take();
    }
}

Value Reader::readString() {
    ++pos_;  // the opening quote
    QString text;
    for (;;) {
        if (atEnd()) fail("malformed string on input", true);
        QChar c = text_[pos_++];
        if (c == '"') return Value::string(text);
        if (c == '\n') ++line_;
        if (c != '\\') {
            text += c;
            continue;
        }
        if (atEnd()) fail("malformed string on input", true);
        c = text_[pos_++];
        switch (c.unicode()) {
            case 'n':
                text += '\n';
                break;
            case 'r':
                text += '\r';
                break;
            case 't':
                text += '\t';
                break;
            case 'e':
                text += QChar(27);
                break;
            default:
                if (c >= '0' && c <= '7') {
                    int code = c.unicode() - '0';
                    for (int k = 0; k < 2 && !atEnd() && peek() >= '0' && peek() <= '7'; ++k)
                        code = code * 8 + (text_[pos_++].unicode() - '0');
                    text += QChar(code);
                } else {
                    if (c == '\n') ++line_;
                    text += c;  // \\ and \" and any other character stand for themselves
                }
        }
    }
}

Value Reader::readAtom() {
    const int start = pos_;
    while (!atEnd() && !isDelimiter(peek()))
        ++pos_;
    const QString token = text_.mid(start, pos_ - start);
    Value number;
    if (parseNumber(token, number)) return number;
    if (token.compare(QLatin1String("nil"), Qt::CaseInsensitive) == 0) return Value();
    return Value::symbol(symbols_.intern(token));
}

}  // namespace zvlisp
