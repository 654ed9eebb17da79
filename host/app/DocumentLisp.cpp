#include "DocumentLisp.h"

#include "Interrupts.h"
#include "LispChains.h"

#include <utility>

namespace zvhost {

namespace {
// Texts remembered before the memory starts over; a run uses a handful.
constexpr int kMaxReadTexts = 512;

using zvlisp::Value;

// Nothing but its one holder refers to the object.
bool alone(const Value& value) {
    return value.isHeap() && value.asObject()->refs == 1;
}

// `slot` made a string of `text`: its own string filled again when nothing else holds it.
inline void fillText(Value& slot, const QString& text) {
    if (slot.isString() && alone(slot)) {
        QString& held = static_cast<zvlisp::StringObject*>(slot.asObject())->text;
        if (!held.isSharedWith(text)) held = text;
        return;
    }
    slot = Value::string(text);
}
}  // namespace

DocumentLisp::DocumentLisp(std::function<void(const QString&)> output) {
    lisp_.setOutput(std::move(output));
}

int DocumentLisp::lispGetSymbol(const QString& name, zvsdk::ResultBuffer** value) {
    if (value) *value = nullptr;
    const zvlisp::Symbol* symbol = knownSymbol(name);
    if (!symbol || !symbol->assigned || !value) return zvsdk::RTERROR;
    try {
        *value = LispChains::toChain(symbol->value);
    } catch (const zvlisp::LispError&) {
        return zvsdk::RTERROR;
    }
    return zvsdk::RTNORM;
}

int DocumentLisp::lispPutSymbol(const QString& name, const zvsdk::ResultBuffer* value) {
    if (name.isEmpty()) return zvsdk::RTERROR;
    zvlisp::Symbol* symbol = symbolOf(name);
    symbol->value = LispChains::value(lisp_, value);
    symbol->assigned = true;
    return zvsdk::RTNORM;
}

int DocumentLisp::lispPutStringPairs(const QString& name, const zvsdk::StringPair* pairs,
                                     int count) {
    if (name.isEmpty()) return zvsdk::RTERROR;
    zvlisp::Symbol* symbol = symbolOf(name);
    if (symbol->value.same(pairs_)) symbol->value = Value();
    Value list = std::move(pairs_);
    // Held elsewhere as a whole: that holder keeps it as it is.
    if (!alone(list)) list = Value();
    // A cell, a pair or a text that something else holds too is left to it and replaced
    // here; the rest is filled again in place.
    Value* link = &list;
    for (int i = 0; i < count; ++i) {
        // Past the end of the last list, the cells a shorter one left over go on.
        if (link->isNil() && spare_.isCons()) *link = std::exchange(spare_, Value());
        if (!link->isCons() || !alone(*link)) *link = Value::cons(Value(), Value());
        zvlisp::Cons* cell = link->asCons();
        if (!cell->car.isCons() || !alone(cell->car)) cell->car = Value::cons(Value(), Value());
        zvlisp::Cons* pair = cell->car.asCons();
        fillText(pair->car, *pairs[i].key);
        fillText(pair->cdr, *pairs[i].value);
        link = &cell->cdr;
    }
    // Items differ in their number of fields: the cells past this list's end are kept for
    // a longer one, instead of being freed now and made again then.
    if (link->isCons() && alone(*link)) spare_ = std::exchange(*link, Value());
    *link = Value();
    symbol->value = list;
    symbol->assigned = true;
    pairs_ = std::move(list);
    return zvsdk::RTNORM;
}

zvlisp::Symbol* DocumentLisp::symbolOf(const QString& name) {
    if (zvlisp::Symbol* known = knownSymbol(name)) return known;
    return remember(name, lisp_.intern(name));
}

zvlisp::Symbol* DocumentLisp::knownSymbol(const QString& name) {
    auto it = symbolsByName_.constFind(name);
    if (it != symbolsByName_.constEnd()) return it.value();
    zvlisp::Symbol* symbol = lisp_.findSymbol(name);
    return symbol ? remember(name, symbol) : nullptr;
}

zvlisp::Symbol* DocumentLisp::remember(const QString& name, zvlisp::Symbol* symbol) {
    // a handful of names in a run; a module that makes up names stays bounded
    if (symbolsByName_.size() >= kMaxReadTexts) symbolsByName_.clear();
    // A text of its own: the name may be a module's constant, gone with the module.
    symbolsByName_.insert(QString(name.constData(), name.size()), symbol);
    return symbol;
}

void DocumentLisp::forgetPairs() {
    pairs_ = Value();
    spare_ = Value();
}

zvsdk::ResultBuffer* DocumentLisp::lispInvoke(const zvsdk::ResultBuffer* call) {
    if (!call || call->restype != zvsdk::RTSTR || interruptRequested()) return nullptr;
    for (const InvokeListener& listener : invokeListeners_)
        listener(call->rstring);
    zvsdk::ResultBuffer* chain = nullptr;
    if (answerAsChain(call, &chain)) return chain;
    // A function nobody defined answers nothing, quietly: the module asks for optional
    // functions of the product. Errors inside a defined one are reported as usual.
    zvlisp::Symbol* symbol = knownSymbol(call->rstring);
    if (!symbol || symbol->value.isNil()) return nullptr;
    {
        const std::vector<zvlisp::Value> args = LispChains::values(lisp_, call->rbnext);
        zvlisp::Value result;
        if (!lisp_.applyTopLevel(Value::symbol(symbol), zvlisp::Args(args.data(), int(args.size())),
                                 &result))
            return nullptr;
        try {
            chain = LispChains::toChain(result);
        } catch (const zvlisp::LispError&) {
            chain = nullptr;
        }
    }
    // A function may answer a list of the whole drawing: once it is a chain, the LISP
    // blocks it took go back for the rest of the command.
    zvlisp::trimPool();
    return chain;
}

void DocumentLisp::addChainAnswer(const QString& function, ChainAnswer answer) {
    zvlisp::Symbol* symbol = lisp_.intern(function);
    chainAnswers_.insert(function, {symbol, symbol->value, std::move(answer), {}});
}

void DocumentLisp::addInvokeListener(InvokeListener listener) {
    invokeListeners_.push_back(std::move(listener));
}

void DocumentLisp::addChainCall(const QString& function, ChainCall call) {
    zvlisp::Symbol* symbol = lisp_.intern(function);
    chainAnswers_.insert(function, {symbol, symbol->value, {}, std::move(call)});
}

bool DocumentLisp::answerAsChain(const zvsdk::ResultBuffer* call, zvsdk::ResultBuffer** chain) {
    if (chainAnswers_.isEmpty()) return false;
    auto source = chainAnswers_.constFind(call->rstring);
    if (source == chainAnswers_.constEnd() || !source->function.isFunction() ||
        !source->symbol->value.same(source->function))
        return false;
    if (!source->call && (call->rbnext || !source->answer)) return false;
    try {
        return source->call ? source->call(lisp_, call->rbnext, chain)
                            : source->answer(lisp_, chain);
    } catch (zvlisp::LispError& error) {
        // as the usual road does with an error: reported, and no answer
        if (!error.handled) lisp_.report(error);
        *chain = nullptr;
        return true;
    }
}

bool DocumentLisp::lispEvaluate(const QString& text) {
    // After a Ctrl+C the command runs out without LISP: it is cancelled anyway.
    if (interruptRequested()) return false;
    auto it = readTexts_.constFind(text);
    if (it == readTexts_.constEnd()) {
        zvlisp::Value forms;
        try {
            forms = lisp_.readAll(text);
        } catch (zvlisp::LispError& error) {
            lisp_.report(error);
            return false;
        }
        if (readTexts_.size() >= kMaxReadTexts) readTexts_.clear();
        it = readTexts_.insert(text, forms);
    }
    const zvlisp::Value forms = it.value();
    return lisp_.evaluateForms(forms);
}

}  // namespace zvhost
