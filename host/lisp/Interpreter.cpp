#include "Interpreter.h"

#include "Builtins.h"
#include "LispFile.h"
#include "Printer.h"
#include "Reader.h"
#include "SmallVector.h"

#include <QFileInfo>
#include <new>

#include <pthread.h>

namespace zvlisp {

namespace {

// The stack this thread may use for evaluation: its size less a margin for the error
// handler and reporting.
long stackLimitOfThread() {
    static thread_local long limit __attribute__((tls_model("initial-exec"))) = 0;
    if (limit == 0) {
        size_t size = 8 << 20;
        pthread_attr_t attr;
        if (pthread_getattr_np(pthread_self(), &attr) == 0) {
            pthread_attr_getstacksize(&attr, &size);
            pthread_attr_destroy(&attr);
        }
        constexpr long kMargin = 1 << 20;
        limit = std::max(long(size) - kMargin, long(size) / 2);
    }
    return limit;
}

}  // namespace

// Counts nested calls; past the limit, or near the end of the stack, the evaluation ends
// in an error, not a crash.
class DepthGuard {
public:
    explicit DepthGuard(Interpreter& in) : in_(in) {
        const char marker = 0;
        if (in_.depth_ == 0) {
            in_.stackBase_ = &marker;
            in_.stackLimit_ = stackLimitOfThread();
        }
        if (++in_.depth_ > in_.maxDepth_ || in_.stackBase_ - &marker > in_.stackLimit_) {
            --in_.depth_;
            in_.fail("stack overflow");
        }
        in_.tick();
    }
    ~DepthGuard() { --in_.depth_; }

private:
    Interpreter& in_;
};

Interpreter::Interpreter() {
    t_ = intern("T");
    t_->value = Value::symbol(t_);
    t_->assigned = true;
    quiet_ = intern("");
    lambda_ = intern("LAMBDA");
    errorHandler_ = intern("*ERROR*");
    registerBuiltins();
}

Interpreter::~Interpreter() = default;

void Interpreter::registerBuiltins() {
    registerSpecialForms(*this);
    registerCoreBuiltins(*this);
    registerMathBuiltins(*this);
    registerListBuiltins(*this);
    registerStringBuiltins(*this);
    registerFileBuiltins(*this);
    registerFileSystemBuiltins(*this);
    registerSystemBuiltins(*this);
    assoc_ = findSymbol("ASSOC")->value.asObject();
}

void Interpreter::define(const QString& name, NativeFn fn, int minArgs, int maxArgs) {
    Symbol* symbol = intern(name);
    symbol->value = Value::object(
        Type::Native, new NativeFunction(symbol->name, minArgs, maxArgs, std::move(fn)));
    symbol->assigned = true;
}

void Interpreter::defineSpecial(const QString& name, SpecialForm form) {
    Symbol* symbol = intern(name);
    symbol->special = form;
    // As a value the form is a built-in function: (type if) is SUBR, as user code tests it.
    // Applied as a function it refuses, since its arguments would already be evaluated.
    if (symbol->value.isNil())
        define(
            name,
            [symbol](Interpreter& in, Args) -> Value { in.fail("bad function: " + symbol->name); },
            0, kVariadic);
}

void Interpreter::setGlobal(const QString& name, Value value) {
    Symbol* symbol = intern(name);
    symbol->value = std::move(value);
    symbol->assigned = true;
}

Value Interpreter::global(const QString& name) const {
    const Symbol* symbol = findSymbol(name);
    return symbol ? valueOf(symbol) : Value();
}

Value Interpreter::valueOf(const Symbol* symbol) {
    if (symbol->value.type() == Type::Deferred) [[unlikely]]
        return static_cast<DeferredList*>(symbol->value.asObject())->list();
    return symbol->value;
}

void Interpreter::poll() {
    if (cancel_.exchange(false, std::memory_order_relaxed) || (cancelCheck_ && cancelCheck_())) {
        LispError error("Function cancelled");
        error.uncatchable = true;
        if (catchDepth_ == 0) error.handled = callErrorHandler(error.message());
        throw error;
    }
}

// ---- evaluation

Value Interpreter::eval(const Value& form) {
    switch (form.type()) {
        case Type::Symbol:
            return valueOf(form.asSymbol());
        case Type::Cons:
            return evalCall(form);
        default:
            return form;
    }
}

Value Interpreter::evalBody(const Value& forms) {
    Value result;
    for (const Value* cell = &forms; cell->isCons(); cell = &cell->asCons()->cdr)
        result = eval(cell->asCons()->car);
    return result;
}

Value Interpreter::evalCall(const Value& form) {
    DepthGuard guard(*this);
    const Cons* cell = form.asCons();
    Value function;
    if (cell->car.isSymbol()) {
        Symbol* symbol = cell->car.asSymbol();
        if (symbol->special) return symbol->special(*this, cell->cdr);
        function = valueOf(symbol);
        if (function.isNil()) fail("no function definition: " + symbol->name);
    } else {
        function = eval(cell->car);
    }
    if (!function.isFunction()) function = toFunction(function);
    if (Value found; assocDeferred(function, cell, found)) return found;
    SmallVector<Value, 6> args;
    const Value* arg = &cell->cdr;
    for (; arg->isCons(); arg = &arg->asCons()->cdr)
        args.push_back(eval(arg->asCons()->car));
    if (!arg->isNil()) badType("listp", *arg);
    return invoke(function, Args(args.data(), args.size()));
}

bool Interpreter::assocDeferred(const Value& function, const Cons* form, Value& result) {
    if (function.asObject() != assoc_ || !form->cdr.isCons()) return false;
    const Cons* first = form->cdr.asCons();
    if (!first->cdr.isCons()) return false;
    const Cons* second = first->cdr.asCons();
    if (!second->cdr.isNil() || !second->car.isSymbol()) return false;
    const Symbol* symbol = second->car.asSymbol();
    if (symbol->value.type() != Type::Deferred) return false;
    // The key is evaluated once, before the list is read, as the call would: what it does
    // may set the symbol again.
    const Value key = eval(first->car);
    if (key.isString() && symbol->value.type() == Type::Deferred) {
        result = static_cast<DeferredList*>(symbol->value.asObject())->assocText(key.asString());
    } else {
        const Value args[2] = {key, valueOf(symbol)};
        result = invoke(function, Args(args, 2));
    }
    return true;
}

Value Interpreter::invoke(const Value& function, Args args) {
    if (function.type() == Type::User)
        return callUser(*static_cast<UserFunction*>(function.asObject()), args);
    const auto& native = *static_cast<NativeFunction*>(function.asObject());
    if (args.size() < native.minArgs) fail("too few arguments");
    if (native.maxArgs != kVariadic && args.size() > native.maxArgs) fail("too many arguments");
    return native.fn(*this, args);
}

void Interpreter::Bindings::bind(Symbol* symbol, Value value) {
    saved_.push_back({symbol, std::move(symbol->value), symbol->assigned});
    symbol->value = std::move(value);
    symbol->assigned = true;
}

Interpreter::Bindings::~Bindings() {
    for (int i = saved_.size() - 1; i >= 0; --i) {
        Binding& saved = saved_[i];
        saved.symbol->value = std::move(saved.value);
        saved.symbol->assigned = saved.assigned;
    }
}

Value Interpreter::callUser(UserFunction& function, Args args) {
    const int count = int(function.params.size());
    if (args.size() < count) fail("too few arguments");
    if (args.size() > count) fail("too many arguments");
    Bindings bindings;
    for (int i = 0; i < count; ++i)
        if (!function.repeated[size_t(i)]) bindings.bind(function.params[size_t(i)], args[i]);
    for (Symbol* local : function.locals)
        bindings.bind(local, Value());
    return evalBody(function.body);
}

Value Interpreter::apply(const Value& function, Args args) {
    DepthGuard guard(*this);
    const Value resolved = function.isFunction() ? function : toFunction(function);
    return invoke(resolved, args);
}

Value Interpreter::call(const QString& name, std::initializer_list<Value> args) {
    return apply(Value::symbol(intern(name)), Args(args.begin(), int(args.size())));
}

Value Interpreter::makeLambda(const QString& name, const Value& params, const Value& body) {
    auto* function = new UserFunction;
    Value result = Value::object(Type::User, function);
    function->name = name;
    function->body = body;
    bool pastSlash = false;
    for (const Value* cell = &params; !cell->isNil(); cell = &cell->asCons()->cdr) {
        if (!cell->isCons()) badType("listp", params);
        Symbol* symbol = toSym(cell->asCons()->car);
        if (symbol->name == QLatin1String("/")) {
            pastSlash = true;
            continue;
        }
        // The first occurrence of a name wins; a later one is ignored.
        auto seen = [&](const std::vector<Symbol*>& list) {
            return std::find(list.begin(), list.end(), symbol) != list.end();
        };
        const bool repeated = seen(function->params) || seen(function->locals);
        if (!pastSlash) {
            function->params.push_back(symbol);
            function->repeated.push_back(repeated);
        } else if (!repeated) {
            function->locals.push_back(symbol);
        }
    }
    return result;
}

Value Interpreter::toFunction(const Value& function) {
    switch (function.type()) {
        case Type::Native:
        case Type::User:
            return function;
        case Type::Symbol: {
            const Value value = valueOf(function.asSymbol());
            if (value.isFunction()) return value;
            if (value.isCons()) return toFunction(value);
            fail("no function definition: " + function.asSymbol()->name);
        }
        case Type::Cons: {
            const Value& head = car(function);
            // (lambda (args) body...) quoted, or a defun-q list ((args / locals) body...).
            if (head.isSymbol() && head.asSymbol() == lambda_)
                return makeLambda("lambda", car(cdr(function)), cdr(cdr(function)));
            if (head.isList()) return makeLambda("defun-q", head, cdr(function));
            break;
        }
        default:
            break;
    }
    fail("bad function: " + Printer::prin1(function));
}

// ---- text

Value Interpreter::read(const QString& text) {
    Reader reader(symbols_, text);
    Value form;
    try {
        reader.next(form);
    } catch (LispError& error) {
        fail(error.message());
    }
    return form;
}

Value Interpreter::evalText(const QString& text, const QString& file) {
    Reader reader(symbols_, text, file);
    Value result;
    struct Where {
        QString& file;
        int& line;
        QString oldFile = file;
        int oldLine = line;
        ~Where() {
            file = oldFile;
            line = oldLine;
        }
    } where{whereFile_, whereLine_};
    for (;;) {
        Value form;
        try {
            if (!reader.next(form)) break;
        } catch (LispError& error) {
            if (catchDepth_ == 0 && !error.handled) {
                error.handled = true;
                report(error);
            }
            throw;
        }
        if (!file.isEmpty()) {
            whereFile_ = file;
            whereLine_ = reader.formLine();
        }
        try {
            result = eval(form);
        } catch (LispError& error) {
            if (error.file.isEmpty() && !file.isEmpty()) {
                error.file = file;
                error.line = reader.formLine();
            }
            throw;
        }
    }
    return result;
}

template <typename Body>
bool Interpreter::topLevel(Body body, Value* result) {
    try {
        Value last = body();
        if (result) *result = std::move(last);
        return true;
    } catch (LispError& error) {
        if (!error.handled) report(error);
        cancel_.store(false, std::memory_order_relaxed);
        return false;
    } catch (const std::bad_alloc&) {
        // The host ends the command: nothing of it is to be trusted or saved.
        cancel_.store(false, std::memory_order_relaxed);
        throw;
    }
}

bool Interpreter::evaluate(const QString& text, Value* result) {
    return topLevel([&] { return evalText(text); }, result);
}

bool Interpreter::applyTopLevel(const Value& function, Args args, Value* result) {
    return topLevel([&] { return apply(function, args); }, result);
}

bool Interpreter::evaluateForms(const Value& forms, Value* result) {
    return topLevel([&] { return evalBody(forms); }, result);
}

Value Interpreter::readAll(const QString& text) {
    Reader reader(symbols_, text);
    ListBuilder forms;
    Value form;
    while (reader.next(form))
        forms.add(std::move(form));
    return forms.take();
}

Value Interpreter::load(const QString& name) {
    const QString path = findFile(LispFile::withLspExtension(name));
    if (path.isEmpty()) fail("LOAD failed: " + Printer::quoted(name));
    QString text;
    if (!LispFile::readText(path, &text)) fail("LOAD failed: " + Printer::quoted(name));
    if (loading_.size() >= 64) fail("LOAD failed: nested too deep: " + Printer::quoted(name));
    loading_.push_back(QFileInfo(path).absolutePath());
    struct Pop {
        QStringList& list;
        ~Pop() { list.removeLast(); }
    } pop{loading_};
    return evalText(text, path);
}

QString Interpreter::findFile(const QString& name) const {
    QStringList folders = searchPaths_;
    if (!loading_.isEmpty()) folders.prepend(loading_.last());
    return LispFile::find(name, folders);
}

// ---- errors

bool Interpreter::callErrorHandler(const QString& message) {
    const Value handler = errorHandler_->value;
    if (handler.isNil() || inErrorHandler_) return false;
    inErrorHandler_ = true;
    // Room for the handler when the depth or the stack was the error.
    maxDepth_ += 200;
    stackLimit_ += 256 << 10;
    try {
        const Value text = Value::string(message);
        invoke(toFunction(handler), Args(&text, 1));
    } catch (LispError& nested) {
        if (!nested.handled)
            write((atLineStart_ ? "; error: " : "\n; error: ") + nested.message() + "\n");
    }
    maxDepth_ -= 200;
    stackLimit_ -= 256 << 10;
    inErrorHandler_ = false;
    return true;
}

void Interpreter::fail(const QString& message) {
    LispError error(message);
    if (catchDepth_ == 0) {
        error.handled = true;
        report(error);
    }
    throw error;
}

void Interpreter::report(LispError& error) {
    error.handled = true;
    ++errorsReported_;
    if (callErrorHandler(error.message())) return;
    write((atLineStart_ ? "; error: " : "\n; error: ") + error.message() + "\n");
    const QString file = error.file.isEmpty() ? whereFile_ : error.file;
    const int line = error.file.isEmpty() ? whereLine_ : error.line;
    if (!file.isEmpty()) write("; in " + file + ", line " + QString::number(line) + "\n");
}

void Interpreter::checkLength(qint64 length, const char* function) {
    if (length > maxStringLength)
        fail(QLatin1String("string too long: ") + QLatin1String(function));
}

void Interpreter::badType(const char* what, const Value& value) {
    fail(QLatin1String("bad argument type: ") + QLatin1String(what) + ' ' + Printer::prin1(value));
}

// ---- argument checks

std::int32_t Interpreter::toInt(const Value& v) {
    if (!v.isInt()) badType("fixnump:", v);
    return v.asInt();
}

double Interpreter::toNumber(const Value& v) {
    if (!v.isNumber()) badType("numberp:", v);
    return v.asNumber();
}

const QString& Interpreter::toStr(const Value& v) {
    if (!v.isString()) badType("stringp", v);
    return v.asString();
}

Symbol* Interpreter::toSym(const Value& v) {
    if (!v.isSymbol()) badType("symbolp", v);
    return v.asSymbol();
}

void Interpreter::checkList(const Value& v) {
    if (!v.isList()) badType("listp", v);
}

std::vector<Value> Interpreter::toVector(const Value& list) {
    std::vector<Value> items;
    const Value* cell = &list;
    for (; cell->isCons(); cell = &cell->asCons()->cdr)
        items.push_back(cell->asCons()->car);
    if (!cell->isNil()) badType("listp", list);
    return items;
}

Value Interpreter::fromVector(const std::vector<Value>& items) {
    Value list;
    for (auto it = items.rbegin(); it != items.rend(); ++it)
        list = Value::cons(*it, std::move(list));
    return list;
}

void Interpreter::write(const QString& text) {
    if (text.isEmpty()) return;
    atLineStart_ = text.endsWith('\n');
    if (output_) output_(text);
}

}  // namespace zvlisp
