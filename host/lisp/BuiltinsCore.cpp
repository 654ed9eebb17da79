// Predicates, type, evaluation, symbols, errors and output.
#include "Builtins.h"
#include "Equality.h"
#include "Interpreter.h"
#include "LispFile.h"
#include "Printer.h"

namespace zvlisp {

namespace {

Value typeOf(Interpreter& in, Args a) {
    static const char* const names[] = {"",
                                        "INT",
                                        "REAL",
                                        "SYM",
                                        "STR",
                                        "LIST",
                                        "SUBR",
                                        "USUBR",
                                        "FILE",
                                        "ENAME",
                                        "VL-CATCH-ALL-APPLY-ERROR",
                                        "PICKSET"};
    if (a[0].isNil()) return Value();
    return Value::symbol(in.intern(names[int(a[0].type())]));
}

LispFile* optionalFile(Interpreter& in, Args a, int index) {
    if (!a.has(index) || a[index].isNil()) return nullptr;
    if (a[index].type() != Type::File) in.badType("streamp", a[index]);
    auto* file = static_cast<LispFile*>(a[index].asObject());
    if (!file->isOpen() || file->reading()) in.badType("streamp", a[index]);
    return file;
}

// princ, prin1 and print: to the file when one is given, else to the command line.
Value output(Interpreter& in, Args a, bool escape, bool newlineBefore) {
    LispFile* file = optionalFile(in, a, 1);
    if (!a.has(0)) return in.quiet();
    QString text = Printer::toText(a[0], escape);
    if (newlineBefore) text = "\n" + text + " ";
    if (file)
        file->write(text);
    else
        in.write(text);
    return a[0];
}

Value mapcar(Interpreter& in, Args a) {
    const Value function = in.toFunction(a[0]);
    std::vector<const Value*> lists;
    for (int i = 1; i < a.size(); ++i) {
        in.checkList(a[i]);
        lists.push_back(&a[i]);
    }
    ListBuilder result;
    std::vector<Value> args(lists.size());
    for (;;) {
        for (size_t i = 0; i < lists.size(); ++i) {
            if (!lists[i]->isCons()) return result.take();
            args[i] = lists[i]->asCons()->car;
            lists[i] = &lists[i]->asCons()->cdr;
        }
        result.add(in.apply(function, Args(args.data(), int(args.size()))));
    }
}

Value atomsFamily(Interpreter& in, Args a) {
    const bool names = in.toInt(a[0]) == 1;
    auto item = [&](Symbol* s) { return names ? Value::string(s->name) : Value::symbol(s); };
    ListBuilder result;
    if (a.has(1) && !a[1].isNil()) {
        for (const Value& name : in.toVector(a[1])) {
            Symbol* s = in.findSymbol(in.toStr(name));
            result.add(s && !s->value.isNil() ? item(s) : Value());
        }
        return result.take();
    }
    for (Symbol* s : in.symbols().all())
        if (!s->value.isNil() && !s->name.isEmpty()) result.add(item(s));
    return result.take();
}

Value catchAllApply(Interpreter& in, Args a) {
    in.checkList(a.has(1) ? a[1] : Value());
    const std::vector<Value> args = in.toVector(a.has(1) ? a[1] : Value());
    QString message;
    Value result =
        in.catching([&] { return in.apply(a[0], Args(args.data(), int(args.size()))); }, &message);
    if (!message.isNull()) return Value::object(Type::Error, new ErrorObject(message));
    return result;
}

void defineIo(Interpreter& in) {
    in.define(
        "princ", [](Interpreter& in, Args a) { return output(in, a, false, false); }, 0, 2);
    in.define(
        "prin1", [](Interpreter& in, Args a) { return output(in, a, true, false); }, 0, 2);
    in.define(
        "print", [](Interpreter& in, Args a) { return output(in, a, true, true); }, 0, 2);
    in.define(
        "terpri",
        [](Interpreter& in, Args) {
            in.write("\n");
            return Value();
        },
        0, 0);
    in.define(
        "prompt",
        [](Interpreter& in, Args a) {
            in.write(in.toStr(a[0]));
            return Value();
        },
        1, 1);
    in.define(
        "vl-prin1-to-string",
        [](Interpreter&, Args a) { return Value::string(Printer::prin1(a[0])); }, 1, 1);
    in.define(
        "vl-princ-to-string",
        [](Interpreter&, Args a) { return Value::string(Printer::princ(a[0])); }, 1, 1);
}

void definePredicates(Interpreter& in) {
    in.define("type", typeOf, 1, 1);
    in.define(
        "null", [](Interpreter& in, Args a) { return in.boolean(a[0].isNil()); }, 1, 1);
    in.define(
        "not", [](Interpreter& in, Args a) { return in.boolean(a[0].isNil()); }, 1, 1);
    in.define(
        "atom", [](Interpreter& in, Args a) { return in.boolean(!a[0].isCons()); }, 1, 1);
    in.define(
        "listp", [](Interpreter& in, Args a) { return in.boolean(a[0].isList()); }, 1, 1);
    in.define(
        "vl-consp", [](Interpreter& in, Args a) { return in.boolean(a[0].isCons()); }, 1, 1);
    in.define(
        "numberp", [](Interpreter& in, Args a) { return in.boolean(a[0].isNumber()); }, 1, 1);
    in.define(
        "vl-symbolp", [](Interpreter& in, Args a) { return in.boolean(a[0].isSymbol()); }, 1, 1);
    in.define(
        "zerop", [](Interpreter& in, Args a) { return in.boolean(in.toNumber(a[0]) == 0.0); }, 1,
        1);
    in.define(
        "minusp", [](Interpreter& in, Args a) { return in.boolean(in.toNumber(a[0]) < 0.0); }, 1,
        1);
    in.define(
        "boundp",
        [](Interpreter& in, Args a) { return in.boolean(!in.toSym(a[0])->value.isNil()); }, 1, 1);
    in.define(
        "eq", [](Interpreter& in, Args a) { return in.boolean(Equality::eq(a[0], a[1])); }, 2, 2);
    in.define(
        "equal",
        [](Interpreter& in, Args a) {
            const double fuzz = a.has(2) ? in.toNumber(a[2]) : 0.0;
            return in.boolean(Equality::equal(a[0], a[1], fuzz));
        },
        2, 3);
}

void defineEvaluation(Interpreter& in) {
    in.define(
        "eval", [](Interpreter& in, Args a) { return in.eval(a[0]); }, 1, 1);
    in.define(
        "apply",
        [](Interpreter& in, Args a) {
            const std::vector<Value> args = in.toVector(a[1]);
            return in.apply(a[0], Args(args.data(), int(args.size())));
        },
        2, 2);
    in.define("mapcar", mapcar, 2);
    in.define(
        "read",
        [](Interpreter& in, Args a) { return a.has(0) ? in.read(in.toStr(a[0])) : Value(); }, 0, 1);
    in.define(
        "set",
        [](Interpreter& in, Args a) {
            Symbol* s = in.toSym(a[0]);
            s->value = a[1];
            s->assigned = true;
            return a[1];
        },
        2, 2);
    in.define(
        "vl-symbol-name",
        [](Interpreter& in, Args a) { return Value::string(in.toSym(a[0])->name); }, 1, 1);
    in.define(
        "vl-symbol-value",
        [](Interpreter& in, Args a) { return Interpreter::valueOf(in.toSym(a[0])); }, 1, 1);
    in.define("atoms-family", atomsFamily, 1, 2);
}

void defineErrors(Interpreter& in) {
    in.define("vl-catch-all-apply", catchAllApply, 1, 2);
    in.define(
        "vl-catch-all-error-p",
        [](Interpreter& in, Args a) { return in.boolean(a[0].type() == Type::Error); }, 1, 1);
    in.define(
        "vl-catch-all-error-message",
        [](Interpreter& in, Args a) {
            if (a[0].type() != Type::Error) in.badType("vl-catch-all-apply-error-p", a[0]);
            return Value::string(static_cast<ErrorObject*>(a[0].asObject())->message);
        },
        1, 1);
    const NativeFn quit = [](Interpreter& in, Args) -> Value { in.fail("quit / exit abort"); };
    in.define("exit", quit, 0, 0);
    in.define("quit", quit, 0, 0);
}

}  // namespace

void registerCoreBuiltins(Interpreter& in) {
    defineIo(in);
    definePredicates(in);
    defineEvaluation(in);
    defineErrors(in);
}

}  // namespace zvlisp
