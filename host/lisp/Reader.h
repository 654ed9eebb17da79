#pragma once
// Reads LISP text into values, one top-level form at a time: symbols ignore case, integers
// are 32-bit (a literal beyond that reads as a real), strings take \\ \" \n \r \t \e and
// \nnn (octal), and comments are ";" to the end of the line or ";| ... |;".
#include "LispError.h"
#include "Value.h"

namespace zvlisp {

class SymbolTable;

class Reader {
public:
    Reader(SymbolTable& symbols, const QString& text, const QString& file = QString());

    // The next form; false when only blanks and comments are left. A malformed text throws
    // a LispError carrying the file and line.
    bool next(Value& form);
    // The line on which the last form began, from 1.
    int formLine() const { return formLine_; }
    // After an error: the text ended inside a list, a string or a comment, so more text
    // could complete it (the interactive prompt asks for another line).
    bool incomplete() const { return incomplete_; }

    // Token classification, shared with `read` and number conversions.
    static bool parseNumber(const QString& token, Value& number);

private:
    Value readForm(int depth);
    Value readList(int depth);
    Value readString();
    Value readAtom();
    void skipBlanks();
    [[noreturn]] void fail(const QString& message, bool atEnd = false);
    bool atEnd() const { return pos_ >= text_.size(); }
    QChar peek() const { return text_[pos_]; }

    SymbolTable& symbols_;
    QString text_;
    QString file_;
    int pos_ = 0;
    int line_ = 1;
    int formLine_ = 1;
    bool incomplete_ = false;
};

}  // namespace zvlisp
