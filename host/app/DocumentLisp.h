#pragma once
// A document's LISP environment behind the SDK's LISP interface: one interpreter per
// document, its output on the document's command line, values crossing as result-buffer
// chains (see LispChains). Host code reaches the interpreter to add functions:
//     documentLisp->interpreter().define("name", fn, minArgs, maxArgs);
#include "lisp/Interpreter.h"
#include "sdk/LispInterface.h"

#include <QHash>

#include <array>
#include <functional>
#include <vector>

namespace zvhost {

class DocumentLisp : public zvsdk::LispInterface {
public:
    explicit DocumentLisp(std::function<void(const QString&)> output);

    zvlisp::Interpreter& interpreter() { return lisp_; }

    // RTERROR and no chain for a symbol never set; a symbol set to nil answers RTNORM
    // with one 5019 node.
    int lispGetSymbol(const QString& name, zvsdk::ResultBuffer** value) override;
    int lispPutSymbol(const QString& name, const zvsdk::ResultBuffer* value) override;
    // The symbol holds the pairs as they are given; the list is made from the texts only
    // when LISP reads the symbol, and `(assoc "text" symbol)` finds its pair without it. A
    // list run publishes one item after another and mostly looks up a field or two. The
    // texts are read until the symbol is set again (pairs or lispPutSymbol), or another
    // name gets pairs: then whatever else still holds the list gets it made whole.
    int lispPutStringPairs(const QString& name, const zvsdk::StringPair* pairs, int count) override;
    int lispGetSymbolFirst(const QString& name, zvsdk::ResultBuffer& first) override;
    // Lets go of the pairs last published: their texts may be a module's own, gone with the
    // module, or gone after the command. What still holds them reads nil.
    void forgetPairs();
    // Errors are printed on the command line and answered with null.
    zvsdk::ResultBuffer* lispInvoke(const zvsdk::ResultBuffer* call) override;
    // The same text is read once: a list run evaluates one expression per item.
    bool lispEvaluate(const QString& text) override;

    // A native function can also answer a call without arguments straight as a chain,
    // without a LISP list in between: a list of the whole drawing costs as much again as
    // values. The answer must be the chain that the function's value would give. It stands
    // while the function's symbol holds the function it holds now (a user's defun takes
    // over as usual); returning false leaves the call to the usual road.
    using ChainAnswer = std::function<bool(zvlisp::Interpreter&, zvsdk::ResultBuffer**)>;
    void addChainAnswer(const QString& function, ChainAnswer answer);
    // The same for a function with arguments, read straight from the call's chain (after
    // the name): a function the module calls for every symbol pays no LISP values on
    // the way. The answer must be what the function would give for the arguments' values.
    using ChainCall = std::function<bool(zvlisp::Interpreter&, const zvsdk::ResultBuffer* args,
                                         zvsdk::ResultBuffer**)>;
    void addChainCall(const QString& function, ChainCall call);
    // The same for a function without arguments that answers wires and their entries (see
    // lispInvokeConnections): the answer goes value by value to the receiver, and must be
    // the values of the chain the function's value would give. False leaves the call to
    // lispInvoke.
    using ConnectionAnswer =
        std::function<bool(zvlisp::Interpreter&, zvsdk::ConnectionReceiver& receiver)>;
    // `prepare`, when given, starts working the answer out ahead (lispPrepareConnections).
    using ConnectionPreparer = std::function<bool(zvlisp::Interpreter&)>;
    void addConnectionAnswer(const QString& function, ConnectionAnswer answer,
                             ConnectionPreparer prepare = {});
    int lispInvokeConnections(const QString& function,
                              zvsdk::ConnectionReceiver& receiver) override;
    bool lispPrepareConnections(const QString& function) override;
    // The same for a function of one text argument that answers polyline handles (see
    // lispInvokePolylines): the handles must be those of the chain the function would give.
    using PolylineAnswer = std::function<bool(zvlisp::Interpreter&, const QString& argument,
                                              zvsdk::PolylineReceiver& receiver)>;
    void addPolylineAnswer(const QString& function, PolylineAnswer answer);
    int lispInvokePolylines(const QString& function, const QString& argument,
                            zvsdk::PolylineReceiver& receiver) override;
    // Told the name of every function the module calls, before the call.
    using InvokeListener = std::function<void(const QString& function)>;
    void addInvokeListener(InvokeListener listener);

private:
    struct ChainSource {
        zvlisp::Symbol* symbol = nullptr;
        zvlisp::Value function;
        ChainAnswer answer;
        ChainCall call;
        ConnectionAnswer connections;
        PolylineAnswer polylines;
        ConnectionPreparer prepare;
    };
    // The source of a function's answers while its symbol holds the function it held when
    // the source was added; null otherwise.
    const ChainSource* sourceOf(const QString& function) const;
    // The entry of `function`, made if new, tied to the function its symbol holds now; the
    // answers already there stay.
    ChainSource& sourceFor(const QString& function);
    // Runs a host's own answer to `function` as lispInvoke runs a call: interrupt first, the
    // listeners told, an error reported; RTNONE when the answer declines.
    int invokeHostAnswer(const QString& function, const std::function<bool()>& answer);
    // True when a chain answer took the call; `chain` is then its result.
    bool answerAsChain(const zvsdk::ResultBuffer* call, zvsdk::ResultBuffer** chain);

    // The symbol of a name the module sets again and again ("reg"), without a look-up.
    zvlisp::Symbol* symbolOf(const QString& name);
    // The symbol if the name was ever used, without making it.
    zvlisp::Symbol* knownSymbol(const QString& name);
    zvlisp::Symbol* remember(const QString& name, zvlisp::Symbol* symbol);
    // The names asked last, looked at before the hash: a list run asks for the same few
    // names at every item, and a name's hash costs more than a comparison or two.
    struct RecentName {
        QString name;
        zvlisp::Symbol* symbol = nullptr;
    };
    zvlisp::Symbol* recentSymbol(const QString& name) const;
    void noteRecent(const QString& name, zvlisp::Symbol* symbol);

    // The pairs last published are about to be set again or replaced: a holder other than
    // `setNow` gets them made whole while their texts stand.
    void settlePairs(zvlisp::Symbol* setNow);

    zvlisp::Interpreter lisp_;
    QHash<QString, zvlisp::Symbol*> symbolsByName_;
    std::array<RecentName, 4> recent_;
    std::size_t nextRecent_ = 0;
    // The pairs last published, kept to be given the next ones, and their symbol.
    zvlisp::Value pairs_;
    zvlisp::Symbol* pairsSymbol_ = nullptr;
    QHash<QString, zvlisp::Value> readTexts_;
    QHash<QString, ChainSource> chainAnswers_;
    std::vector<InvokeListener> invokeListeners_;
};

}  // namespace zvhost
