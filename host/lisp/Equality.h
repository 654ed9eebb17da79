#pragma once
// The equality and ordering tests of the dialect: eq, equal (with fuzz), = and <.
#include "Value.h"

namespace zvlisp {

class Interpreter;

class Equality {
public:
    // Same object, or same immediate value (1 and 1, 'a and 'a).
    static bool eq(const Value& a, const Value& b) { return a.same(b); }
    // Same structure; numbers within `fuzz` of each other.
    static bool equal(const Value& a, const Value& b, double fuzz = 0.0, int depth = 0);
    // = between two numbers or two strings; other pairs compare by eq.
    static bool numericEqual(const Value& a, const Value& b);
    // <0, 0, >0 between two numbers or two strings; fails for anything else.
    static int compare(Interpreter& in, const Value& a, const Value& b);
};

}  // namespace zvlisp
