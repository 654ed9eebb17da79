#pragma once
// A symbol: one name (upper case) in the single namespace of functions and variables.
#include "Value.h"

namespace zvlisp {

class Interpreter;

// A form whose arguments are not evaluated before the call (setq, if, defun...).
using SpecialForm = Value (*)(Interpreter&, const Value& args);

struct Symbol {
    explicit Symbol(const QString& n) : name(n) {}
    QString name;
    Value value;
    // Set at least once (a symbol set to nil stays "assigned": nil is then its value).
    bool assigned = false;
    SpecialForm special = nullptr;
};

}  // namespace zvlisp
