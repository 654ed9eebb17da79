#pragma once
// One LISP environment: its symbols, the evaluator with dynamic scope, the built-in
// functions, output to a command line, files and the limits that keep a runaway program
// from crashing the host.
//
// Host code adds functions with define():
//     lisp.define("zvDobro", [](Interpreter& in, Args a) {
//         return Value::integer(2 * in.toInt(a[0]));
//     }, 1, 1);
// A user defun of the same name replaces it, as any assignment does. C++ calls back into
// LISP with call("name", {args}) or apply(function, args); evaluate() runs text and reports
// errors on the command line, evalText() lets the LispError through instead.
#include "Function.h"
#include "LispError.h"
#include "SmallVector.h"
#include "Symbol.h"
#include "SymbolTable.h"
#include "Value.h"

#include <QStringList>

#include <atomic>
#include <functional>
#include <initializer_list>
#include <vector>

namespace zvlisp {

// System variables that the number formatting functions read.
struct Units {
    int lunits = 2;  // rtos mode
    int luprec = 4;  // rtos precision
    int aunits = 0;  // angtos mode
    int auprec = 0;  // angtos precision
    int dimzin = 0;  // zero suppression: 0 keeps trailing zeros, 8 drops them, 4 leading
};

class Interpreter {
public:
    Interpreter();
    ~Interpreter();
    Interpreter(const Interpreter&) = delete;
    Interpreter& operator=(const Interpreter&) = delete;

    // ---- symbols and registration
    Symbol* intern(const QString& name) { return symbols_.intern(name); }
    Symbol* findSymbol(const QString& name) const { return symbols_.find(name); }
    SymbolTable& symbols() { return symbols_; }
    void define(const QString& name, NativeFn fn, int minArgs = 0, int maxArgs = kVariadic);
    void defineSpecial(const QString& name, SpecialForm form);
    void setGlobal(const QString& name, Value value);
    // The value of a global; nil when unset.
    Value global(const QString& name) const;
    // The symbol's value, a deferred list made whole.
    static Value valueOf(const Symbol* symbol);
    Value t() const { return Value::symbol(t_); }
    Value boolean(bool b) const { return b ? t() : Value(); }
    // The empty symbol (princ) gives: the prompt prints nothing for it.
    Value quiet() const { return Value::symbol(quiet_); }

    // ---- evaluation
    Value eval(const Value& form);
    // The forms of a list, in order; the last value.
    Value evalBody(const Value& forms);
    // A function value, a symbol naming one, a lambda list or a defun-q list, applied.
    Value apply(const Value& function, Args args);
    Value call(const QString& name, std::initializer_list<Value> args);
    // Reads and evaluates all forms of the text; errors go to the caller as LispError.
    Value evalText(const QString& text, const QString& file = QString());
    // As evalText, but an error is reported (by *error* or on the command line) and
    // answered with false. The last value goes to `result`.
    bool evaluate(const QString& text, Value* result = nullptr);
    // apply() with errors reported as evaluate() does; false after an error.
    bool applyTopLevel(const Value& function, Args args, Value* result = nullptr);
    // The forms of a list evaluated as evaluate() does, errors reported.
    bool evaluateForms(const Value& forms, Value* result = nullptr);
    // The first form of the text, not evaluated; nil for blank text.
    Value read(const QString& text);
    // All forms of the text as a list, not evaluated; a malformed text throws, unreported.
    Value readAll(const QString& text);
    // Loads a LISP file found by the .lsp search; throws when missing or failing.
    Value load(const QString& name);
    // Turns what apply accepts into a function object, or fails with "bad function".
    Value toFunction(const Value& function);

    // ---- errors
    // Calls *error* (or prints the message) unless inside vl-catch-all-apply, then throws.
    [[noreturn]] void fail(const QString& message);
    // "bad argument type: numberp: nil" and the like; `what` is the test's name as shown.
    [[noreturn]] void badType(const char* what, const Value& value);
    // What the top level does with an error that reached it.
    void report(LispError& error);
    // Depth of nested calls before "stack overflow". Whatever the depth, evaluation stops
    // before the thread's stack runs out (1 MB is kept for error handling).
    void setMaxDepth(int depth) { maxDepth_ = depth; }
    // Stops the running evaluation with "Function cancelled" at the next call or loop
    // step; safe from another thread or a signal handler.
    void requestCancel() { cancel_.store(true, std::memory_order_relaxed); }
    // Asked now and then during evaluation; true cancels (a GUI host polls its events).
    void setCancelCheck(std::function<bool()> check) { cancelCheck_ = std::move(check); }
    // A step of a loop: checks for cancellation now and then.
    void tick() {
        if (cancel_.load(std::memory_order_relaxed) || (++steps_ & 4095) == 0) poll();
    }
    // Runs `body` with errors caught: vl-catch-all-apply. *error* is not called.
    template <typename Body>
    Value catching(Body body, QString* message);

    // ---- argument checks used by the built-ins
    std::int32_t toInt(const Value& v);
    double toNumber(const Value& v);
    const QString& toStr(const Value& v);
    Symbol* toSym(const Value& v);
    void checkList(const Value& v);
    // Elements of a proper list; "bad argument type: listp" otherwise.
    std::vector<Value> toVector(const Value& list);
    static Value fromVector(const std::vector<Value>& items);

    // ---- command line output
    void setOutput(std::function<void(const QString&)> output) { output_ = std::move(output); }
    void write(const QString& text);

    // ---- files
    // Folders searched, after the current one, by load and findfile.
    QStringList& searchPaths() { return searchPaths_; }
    // The full path of a file by the search; empty when not found.
    QString findFile(const QString& name) const;

    Units units;
    // The units table of cvunit (see UnitTable); the host sets it to the file it ships.
    QString unitTableFile;
    // Functions that build text fail with "string too long: NAME" beyond this many
    // characters, long before the memory runs out.
    int maxStringLength = 64 << 20;
    // The text a function named `function` is about to build must fit maxStringLength.
    void checkLength(qint64 length, const char* function);
    // Errors that reached the top level and were reported; a host compares the count before
    // and after a command.
    int errorsReported() const { return errorsReported_; }

    // Helpers for the evaluator's special forms.
    Value makeLambda(const QString& name, const Value& params, const Value& body);
    Symbol* lambdaSymbol() const { return lambda_; }
    struct Binding {
        Symbol* symbol = nullptr;
        Value value;
        bool assigned = false;
    };
    // Saves a symbol's value and gives it a new one until restore().
    class Bindings;

private:
    friend class DepthGuard;
    Value evalCall(const Value& form);
    // (assoc key symbol) on a symbol holding a deferred list, answered without making the
    // list; false when the form is not that.
    bool assocDeferred(const Value& function, const Cons* form, Value& result);
    template <typename Body>
    bool topLevel(Body body, Value* result);
    Value invoke(const Value& function, Args args);
    Value callUser(UserFunction& function, Args args);
    bool callErrorHandler(const QString& message);
    void poll();
    void registerBuiltins();

    SymbolTable symbols_;
    Symbol* t_ = nullptr;
    Symbol* quiet_ = nullptr;
    Symbol* lambda_ = nullptr;
    const Object* assoc_ = nullptr;  // the built-in assoc, as registered
    Symbol* errorHandler_ = nullptr;
    std::function<void(const QString&)> output_;
    bool atLineStart_ = true;  // errors begin on a line of their own
    QStringList searchPaths_;
    QStringList loading_;  // folders of the files being loaded, innermost last
    // The file and line of the top-level form being evaluated, for error messages.
    QString whereFile_;
    int whereLine_ = 0;
    int depth_ = 0;
    int maxDepth_ = 1000000;
    const char* stackBase_ = nullptr;  // where the outermost evaluation began
    long stackLimit_ = 0;              // bytes of stack evaluation may use
    int catchDepth_ = 0;
    bool inErrorHandler_ = false;
    unsigned steps_ = 0;
    int errorsReported_ = 0;
    std::atomic<bool> cancel_{false};
    std::function<bool()> cancelCheck_;
};

class Interpreter::Bindings {
public:
    void bind(Symbol* symbol, Value value);
    ~Bindings();

private:
    SmallVector<Binding, 8> saved_;
};

template <typename Body>
Value Interpreter::catching(Body body, QString* message) {
    const int depth = depth_;
    // Whatever leaves the body, memory exhaustion included, ends the catch.
    struct CatchScope {
        int& depth;
        explicit CatchScope(int& d) : depth(d) { ++depth; }
        ~CatchScope() { --depth; }
    };
    try {
        CatchScope scope(catchDepth_);
        return body();
    } catch (LispError& error) {
        depth_ = depth;
        if (error.uncatchable) throw;
        *message = error.message();
        return Value();
    }
}

}  // namespace zvlisp
