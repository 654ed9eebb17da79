#pragma once
// Functions: native ones registered by C++ code and user ones made by defun or lambda.
#include "Value.h"

#include <functional>
#include <vector>

namespace zvlisp {

class Interpreter;
struct Symbol;

// The evaluated arguments of a call.
class Args {
public:
    Args(const Value* data, int count) : data_(data), count_(count) {}
    int size() const { return count_; }
    bool has(int i) const { return i < count_; }
    const Value& operator[](int i) const { return data_[i]; }
    const Value* begin() const { return data_; }
    const Value* end() const { return data_ + count_; }

private:
    const Value* data_;
    int count_;
};

using NativeFn = std::function<Value(Interpreter&, Args)>;

// Any number of arguments.
constexpr int kVariadic = -1;

struct NativeFunction : Object {
    NativeFunction(const QString& n, int min, int max, NativeFn f)
        : name(n), minArgs(min), maxArgs(max), fn(std::move(f)) {}
    QString name;
    int minArgs;
    int maxArgs;
    NativeFn fn;
};

struct UserFunction : Object {
    UserFunction() : Object(Holds::Body) {}
    QString name;
    std::vector<Symbol*> params;
    // Parallel to params: a repeated parameter takes its argument but binds nothing.
    std::vector<bool> repeated;
    std::vector<Symbol*> locals;
    Value body;  // the list of forms
};

}  // namespace zvlisp
