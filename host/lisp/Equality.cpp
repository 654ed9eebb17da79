#include "Equality.h"

#include "Function.h"
#include "Interpreter.h"

#include <cmath>

namespace zvlisp {

bool Equality::equal(const Value& a, const Value& b, double fuzz, int depth) {
    if (depth > 2000) throw LispError("stack overflow");
    if (a.isNumber() && b.isNumber()) return std::fabs(a.asNumber() - b.asNumber()) <= fuzz;
    if (a.type() != b.type()) return false;
    switch (a.type()) {
        case Type::String:
            return a.asString() == b.asString();
        case Type::Ename:
            return static_cast<EnameObject*>(a.asObject())->name ==
                   static_cast<EnameObject*>(b.asObject())->name;
        case Type::Cons:
            break;
        default:
            return a.same(b);
    }
    const Value* x = &a;
    const Value* y = &b;
    while (x->isCons() && y->isCons()) {
        if (!equal(x->asCons()->car, y->asCons()->car, fuzz, depth + 1)) return false;
        x = &x->asCons()->cdr;
        y = &y->asCons()->cdr;
    }
    return equal(*x, *y, fuzz, depth + 1);
}

bool Equality::numericEqual(const Value& a, const Value& b) {
    if (a.isNumber() && b.isNumber()) return a.asNumber() == b.asNumber();
    if (a.isString() && b.isString()) return a.asString() == b.asString();
    return a.same(b);
}

int Equality::compare(Interpreter& in, const Value& a, const Value& b) {
    if (a.isNumber() && b.isNumber()) {
        if (a.isInt() && b.isInt()) return a.asInt() < b.asInt() ? -1 : a.asInt() > b.asInt();
        const double x = a.asNumber(), y = b.asNumber();
        return x < y ? -1 : x > y;
    }
    if (a.isString() && b.isString()) return a.asString().compare(b.asString());
    in.badType("numberp:", a.isNumber() || a.isString() ? b : a);
}

}  // namespace zvlisp
