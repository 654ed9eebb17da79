#pragma once
// Values as text: prin1 form (strings quoted and escaped, readable back) or princ form.
#include "Value.h"

namespace zvlisp {

class Printer {
public:
    static QString prin1(const Value& value) { return toText(value, true); }
    static QString princ(const Value& value) { return toText(value, false); }
    static QString toText(const Value& value, bool escape);
    // A real as this dialect shows it: six significant digits, always with a decimal point.
    static QString real(double value);
    static QString quoted(const QString& text);

private:
    static void append(QString& out, const Value& value, bool escape, int depth);
};

}  // namespace zvlisp
