#include "DocumentLisp.h"

#include "Interrupts.h"
#include "LispChains.h"

namespace zvhost {

namespace {
// Texts remembered before the memory starts over; a run uses a handful.
constexpr int kMaxReadTexts = 512;
}  // namespace

DocumentLisp::DocumentLisp(std::function<void(const QString&)> output) {
    lisp_.setOutput(std::move(output));
}

int DocumentLisp::lispGetSymbol(const QString& name, zvsdk::ResultBuffer** value) {
    if (value) *value = nullptr;
    const zvlisp::Symbol* symbol = lisp_.findSymbol(name);
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
    lisp_.setGlobal(name, LispChains::value(lisp_, value));
    return zvsdk::RTNORM;
}

int DocumentLisp::lispPutStringPairs(const QString& name, const zvsdk::StringPair* pairs,
                                     int count) {
    if (name.isEmpty()) return zvsdk::RTERROR;
    zvlisp::Value list;
    for (int i = count - 1; i >= 0; --i) {
        zvlisp::Value pair = zvlisp::Value::cons(zvlisp::Value::string(*pairs[i].key),
                                                 zvlisp::Value::string(*pairs[i].value));
        list = zvlisp::Value::cons(std::move(pair), std::move(list));
    }
    lisp_.setGlobal(name, std::move(list));
    return zvsdk::RTNORM;
}

zvsdk::ResultBuffer* DocumentLisp::lispInvoke(const zvsdk::ResultBuffer* call) {
    if (!call || call->restype != zvsdk::RTSTR || interruptRequested()) return nullptr;
    // A function nobody defined answers nothing, quietly: the module asks for optional
    // functions of the product. Errors inside a defined one are reported as usual.
    if (lisp_.global(call->rstring).isNil()) return nullptr;
    zvsdk::ResultBuffer* chain = nullptr;
    if (!call->rbnext && answerAsChain(call->rstring, &chain)) return chain;
    {
        const std::vector<zvlisp::Value> args = LispChains::values(lisp_, call->rbnext);
        const zvlisp::Value function = zvlisp::Value::symbol(lisp_.intern(call->rstring));
        zvlisp::Value result;
        if (!lisp_.applyTopLevel(function, zvlisp::Args(args.data(), int(args.size())), &result))
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
    chainAnswers_.insert(function, {lisp_.global(function), std::move(answer)});
}

bool DocumentLisp::answerAsChain(const QString& function, zvsdk::ResultBuffer** chain) {
    if (chainAnswers_.isEmpty()) return false;
    auto source = chainAnswers_.constFind(function);
    if (source == chainAnswers_.constEnd() || !source->function.isFunction() ||
        !lisp_.global(function).same(source->function))
        return false;
    try {
        return source->answer(lisp_, chain);
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
