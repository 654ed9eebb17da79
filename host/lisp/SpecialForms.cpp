// Forms whose arguments are not evaluated before the call.
#include "Builtins.h"
#include "Interpreter.h"

#include <algorithm>

namespace zvlisp {

namespace {

int length(const Value& list) {
    int n = 0;
    for (const Value* c = &list; c->isCons(); c = &c->asCons()->cdr)
        ++n;
    return n;
}

void arity(Interpreter& in, const Value& args, int min, int max) {
    const int n = length(args);
    if (n < min) in.fail("too few arguments");
    if (max >= 0 && n > max) in.fail("too many arguments");
}

Value quote(Interpreter& in, const Value& args) {
    arity(in, args, 1, 1);
    return car(args);
}

Value setq(Interpreter& in, const Value& args) {
    Value result;
    for (const Value* c = &args; c->isCons(); c = &cdr(*c).asCons()->cdr) {
        Symbol* symbol = in.toSym(c->asCons()->car);
        if (!cdr(*c).isCons()) in.fail("too few arguments");
        result = in.eval(car(cdr(*c)));
        symbol->value = result;
        symbol->assigned = true;
    }
    return result;
}

Value ifForm(Interpreter& in, const Value& args) {
    arity(in, args, 2, 3);
    if (!in.eval(car(args)).isNil()) return in.eval(car(cdr(args)));
    return in.eval(car(cdr(cdr(args))));
}

Value cond(Interpreter& in, const Value& args) {
    for (const Value* c = &args; c->isCons(); c = &c->asCons()->cdr) {
        const Value& clause = c->asCons()->car;
        if (!clause.isCons()) in.badType("consp", clause);
        Value test = in.eval(clause.asCons()->car);
        if (test.isNil()) continue;
        return clause.asCons()->cdr.isNil() ? test : in.evalBody(clause.asCons()->cdr);
    }
    return Value();
}

Value progn(Interpreter& in, const Value& args) {
    return in.evalBody(args);
}

Value whileForm(Interpreter& in, const Value& args) {
    arity(in, args, 1, -1);
    Value result;
    while (!in.eval(car(args)).isNil()) {
        in.tick();
        result = in.evalBody(cdr(args));
    }
    return result;
}

Value repeat(Interpreter& in, const Value& args) {
    arity(in, args, 1, -1);
    const std::int32_t count = in.toInt(in.eval(car(args)));
    Value result;
    for (std::int32_t i = 0; i < count; ++i) {
        in.tick();
        result = in.evalBody(cdr(args));
    }
    return result;
}

Value foreach (Interpreter& in, const Value& args) {
    arity(in, args, 2, -1);
    Symbol* symbol = in.toSym(car(args));
    const Value list = in.eval(car(cdr(args)));
    in.checkList(list);
    const Value body = cdr(cdr(args));
    Interpreter::Bindings binding;
    binding.bind(symbol, Value());
    Value result;
    for (const Value* c = &list; c->isCons(); c = &c->asCons()->cdr) {
        in.tick();
        symbol->value = c->asCons()->car;
        result = in.evalBody(body);
    }
    return result;
}

Value andForm(Interpreter& in, const Value& args) {
    for (const Value* c = &args; c->isCons(); c = &c->asCons()->cdr)
        if (in.eval(c->asCons()->car).isNil()) return Value();
    return in.t();
}

Value orForm(Interpreter& in, const Value& args) {
    for (const Value* c = &args; c->isCons(); c = &c->asCons()->cdr)
        if (!in.eval(c->asCons()->car).isNil()) return in.t();
    return Value();
}

Value lambda(Interpreter& in, const Value& args) {
    arity(in, args, 1, -1);
    return in.makeLambda("lambda", car(args), cdr(args));
}

Value defun(Interpreter& in, const Value& args) {
    arity(in, args, 2, -1);
    Symbol* name = in.toSym(car(args));
    name->value = in.makeLambda(name->name, car(cdr(args)), cdr(cdr(args)));
    name->assigned = true;
    return car(args);
}

// The function stays a list, ((args / locals) body...), that code may read and change.
Value defunQ(Interpreter& in, const Value& args) {
    arity(in, args, 2, -1);
    Symbol* name = in.toSym(car(args));
    in.makeLambda(name->name, car(cdr(args)), cdr(cdr(args)));  // checks the parameters
    name->value = cdr(args);
    name->assigned = true;
    return car(args);
}

}  // namespace

void registerSpecialForms(Interpreter& in) {
    in.defineSpecial("quote", quote);
    in.defineSpecial("function", quote);
    in.defineSpecial("setq", setq);
    in.defineSpecial("if", ifForm);
    in.defineSpecial("cond", cond);
    in.defineSpecial("progn", progn);
    in.defineSpecial("while", whileForm);
    in.defineSpecial("repeat", repeat);
    in.defineSpecial("foreach", foreach);
    in.defineSpecial("and", andForm);
    in.defineSpecial("or", orForm);
    // (apply 'and list) and (apply 'or list) are common: as values, and, or and progn are
    // functions of evaluated arguments.
    in.define("and", [](Interpreter& in, Args a) {
        return in.boolean(
            std::none_of(a.begin(), a.end(), [](const Value& v) { return v.isNil(); }));
    });
    in.define("or", [](Interpreter& in, Args a) {
        return in.boolean(
            std::any_of(a.begin(), a.end(), [](const Value& v) { return !v.isNil(); }));
    });
    in.define("progn", [](Interpreter&, Args a) { return a.size() ? a[a.size() - 1] : Value(); });
    in.defineSpecial("lambda", lambda);
    in.defineSpecial("defun", defun);
    in.defineSpecial("defun-q", defunQ);
}

}  // namespace zvlisp
