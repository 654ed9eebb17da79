#include "DocumentLisp.h"

#include "Interrupts.h"
#include "LispChains.h"

#include <cstring>
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

// The pairs a module published, read from its texts only when LISP asks.
struct PublishedPairs : zvlisp::DeferredList {
    std::vector<zvsdk::StringPair> pairs;
    Value made;
    bool isMade = false;

    Value list() override {
        if (!isMade) {
            for (auto p = pairs.rbegin(); p != pairs.rend(); ++p)
                made = Value::cons(Value::cons(Value::string(*p->key), Value::string(*p->value)),
                                   std::move(made));
            drop();
            isMade = true;
        }
        return made;
    }
    Value assocText(const QString& key) override {
        if (isMade) {
            for (const Value* c = &made; c->isCons(); c = &c->asCons()->cdr) {
                const Value& pair = c->asCons()->car;
                if (pair.asCons()->car.asString() == key) return pair;
            }
            return Value();
        }
        // Only a text of the same length can be equal: most keys pass without a comparison.
        for (const zvsdk::StringPair& p : pairs)
            if (p.key->size() == key.size() && *p.key == key)
                return Value::cons(Value::string(*p.key), Value::string(*p.value));
        return Value();
    }
    void fill(const zvsdk::StringPair* given, int count) {
        pairs.assign(given, given + count);
        made = Value();
        isMade = false;
    }
    // Reads nil from now on: the texts are gone.
    void forget() {
        drop();
        made = Value();
        isMade = true;
    }

private:
    void drop() { std::vector<zvsdk::StringPair>().swap(pairs); }
};

}  // namespace

DocumentLisp::DocumentLisp(std::function<void(const QString&)> output) {
    lisp_.setOutput(std::move(output));
}

int DocumentLisp::lispGetSymbol(const QString& name, zvsdk::ResultBuffer** value) {
    if (value) *value = nullptr;
    const zvlisp::Symbol* symbol = knownSymbol(name);
    if (!symbol || !symbol->assigned || !value) return zvsdk::RTERROR;
    try {
        *value = LispChains::toChain(zvlisp::Interpreter::valueOf(symbol));
    } catch (const zvlisp::LispError&) {
        return zvsdk::RTERROR;
    }
    return zvsdk::RTNORM;
}

int DocumentLisp::lispGetSymbolFirst(const QString& name, zvsdk::ResultBuffer& first) {
    const zvlisp::Symbol* symbol = knownSymbol(name);
    if (!symbol || !symbol->assigned) return zvsdk::RTERROR;
    // An atom as the chain's first node would hold it; a list, or anything printed, goes
    // through the chain.
    first = zvsdk::ResultBuffer();
    try {
        const Value value = zvlisp::Interpreter::valueOf(symbol);
        switch (value.type()) {
            case zvlisp::Type::Nil:
                first.restype = zvsdk::RTNIL;
                return zvsdk::RTNORM;
            case zvlisp::Type::Int:
                if (value.asInt() >= -32768 && value.asInt() <= 32767) {
                    first.restype = zvsdk::RTSHORT;
                    first.rint = short(value.asInt());
                } else {
                    first.restype = zvsdk::RTLONG;
                    first.rlong = value.asInt();
                }
                return zvsdk::RTNORM;
            case zvlisp::Type::Real:
                first.restype = zvsdk::RTREAL;
                first.rreal = value.asReal();
                return zvsdk::RTNORM;
            case zvlisp::Type::String:
                first.restype = zvsdk::RTSTR;
                first.rstring = value.asString();
                return zvsdk::RTNORM;
            case zvlisp::Type::Symbol:
                // T answers most tests, a list's filter at every item: no chain for it.
                if (value.asSymbol()->name != QLatin1String("T")) break;
                first.restype = zvsdk::RTT;
                return zvsdk::RTNORM;
            default:
                break;
        }
    } catch (const zvlisp::LispError&) {
        return zvsdk::RTERROR;
    }
    return LispInterface::lispGetSymbolFirst(name, first);
}

int DocumentLisp::lispPutSymbol(const QString& name, const zvsdk::ResultBuffer* value) {
    if (name.isEmpty()) return zvsdk::RTERROR;
    zvlisp::Symbol* symbol = symbolOf(name);
    if (symbol == pairsSymbol_) settlePairs(symbol);
    symbol->value = LispChains::value(lisp_, value);
    symbol->assigned = true;
    return zvsdk::RTNORM;
}

int DocumentLisp::lispPutStringPairs(const QString& name, const zvsdk::StringPair* pairs,
                                     int count) {
    if (name.isEmpty()) return zvsdk::RTERROR;
    zvlisp::Symbol* symbol = symbolOf(name);
    settlePairs(symbol);
    symbol->assigned = true;
    pairsSymbol_ = symbol;
    if (count <= 0) {
        symbol->value = Value();
        return zvsdk::RTNORM;
    }
    if (pairs_.isNil()) pairs_ = Value::object(zvlisp::Type::Deferred, new PublishedPairs);
    static_cast<PublishedPairs*>(pairs_.asObject())->fill(pairs, count);
    symbol->value = pairs_;
    return zvsdk::RTNORM;
}

void DocumentLisp::settlePairs(zvlisp::Symbol* setNow) {
    if (pairs_.isNil()) return;
    if (setNow && setNow->value.same(pairs_)) setNow->value = Value();
    if (alone(pairs_)) return;
    // A binding saved it, or another symbol still shows it: that holder keeps the list as
    // it stands, and the next pairs go to a new one.
    static_cast<PublishedPairs*>(pairs_.asObject())->list();
    pairs_ = Value();
}

zvlisp::Symbol* DocumentLisp::symbolOf(const QString& name) {
    if (zvlisp::Symbol* known = knownSymbol(name)) return known;
    return remember(name, lisp_.intern(name));
}

zvlisp::Symbol* DocumentLisp::knownSymbol(const QString& name) {
    if (zvlisp::Symbol* recent = recentSymbol(name)) return recent;
    auto it = symbolsByName_.constFind(name);
    if (it != symbolsByName_.constEnd()) {
        noteRecent(it.key(), it.value());
        return it.value();
    }
    zvlisp::Symbol* symbol = lisp_.findSymbol(name);
    return symbol ? remember(name, symbol) : nullptr;
}

zvlisp::Symbol* DocumentLisp::recentSymbol(const QString& name) const {
    const qsizetype size = name.size();
    for (const RecentName& recent : recent_)
        if (recent.symbol && recent.name.size() == size &&
            std::memcmp(recent.name.constData(), name.constData(), size * sizeof(QChar)) == 0)
            return recent.symbol;
    return nullptr;
}

void DocumentLisp::noteRecent(const QString& name, zvlisp::Symbol* symbol) {
    recent_[nextRecent_] = {name, symbol};
    nextRecent_ = (nextRecent_ + 1) % recent_.size();
}

zvlisp::Symbol* DocumentLisp::remember(const QString& name, zvlisp::Symbol* symbol) {
    // a handful of names in a run; a module that makes up names stays bounded
    if (symbolsByName_.size() >= kMaxReadTexts) symbolsByName_.clear();
    // A text of its own: the name may be a module's constant, gone with the module.
    symbolsByName_.insert(QString(name.constData(), name.size()), symbol);
    return symbol;
}

void DocumentLisp::forgetPairs() {
    if (!pairs_.isNil()) {
        auto* published = static_cast<PublishedPairs*>(pairs_.asObject());
        if (!published->isMade) published->forget();
    }
    pairs_ = Value();
    pairsSymbol_ = nullptr;
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

DocumentLisp::ChainSource& DocumentLisp::sourceFor(const QString& function) {
    zvlisp::Symbol* symbol = lisp_.intern(function);
    ChainSource& source = chainAnswers_[function];
    source.symbol = symbol;
    source.function = symbol->value;
    return source;
}

void DocumentLisp::addChainAnswer(const QString& function, ChainAnswer answer) {
    ChainSource& source = sourceFor(function);
    source.answer = std::move(answer);
    source.call = {};
}

void DocumentLisp::addConnectionAnswer(const QString& function, ConnectionAnswer answer,
                                       ConnectionPreparer prepare) {
    ChainSource& source = sourceFor(function);
    source.call = {};
    source.connections = std::move(answer);
    source.prepare = std::move(prepare);
}

bool DocumentLisp::lispPrepareConnections(const QString& function) {
    const ChainSource* source = sourceOf(function);
    if (!source || !source->connections || !source->prepare) return false;
    try {
        return source->prepare(lisp_);
    } catch (zvlisp::LispError&) {
        // the call itself fails the same way, and reports it then
        return false;
    }
}

int DocumentLisp::invokeHostAnswer(const QString& function, const std::function<bool()>& answer) {
    // what lispInvoke does before any call
    if (interruptRequested()) return zvsdk::RTERROR;
    for (const InvokeListener& listener : invokeListeners_)
        listener(function);
    try {
        return answer() ? zvsdk::RTNORM : zvsdk::RTNONE;
    } catch (zvlisp::LispError& error) {
        if (!error.handled) lisp_.report(error);
        return zvsdk::RTERROR;
    }
}

int DocumentLisp::lispInvokeConnections(const QString& function,
                                        zvsdk::ConnectionReceiver& receiver) {
    const ChainSource* source = sourceOf(function);
    if (!source || !source->connections) return zvsdk::RTNONE;
    return invokeHostAnswer(function, [&] { return source->connections(lisp_, receiver); });
}

void DocumentLisp::addPolylineAnswer(const QString& function, PolylineAnswer answer) {
    sourceFor(function).polylines = std::move(answer);
}

int DocumentLisp::lispInvokePolylines(const QString& function, const QString& argument,
                                      zvsdk::PolylineReceiver& receiver) {
    const ChainSource* source = sourceOf(function);
    if (!source || !source->polylines) return zvsdk::RTNONE;
    return invokeHostAnswer(function, [&] { return source->polylines(lisp_, argument, receiver); });
}

const DocumentLisp::ChainSource* DocumentLisp::sourceOf(const QString& function) const {
    auto source = chainAnswers_.constFind(function);
    if (source == chainAnswers_.constEnd() || !source->function.isFunction() ||
        !source->symbol->value.same(source->function))
        return nullptr;
    return &*source;
}

void DocumentLisp::addInvokeListener(InvokeListener listener) {
    invokeListeners_.push_back(std::move(listener));
}

void DocumentLisp::addChainCall(const QString& function, ChainCall call) {
    // A call takes the place of the answers without arguments.
    ChainSource& source = sourceFor(function);
    source.answer = {};
    source.call = std::move(call);
    source.connections = {};
    source.prepare = {};
}

bool DocumentLisp::answerAsChain(const zvsdk::ResultBuffer* call, zvsdk::ResultBuffer** chain) {
    if (chainAnswers_.isEmpty()) return false;
    const ChainSource* source = sourceOf(call->rstring);
    if (!source) return false;
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
