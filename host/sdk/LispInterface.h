#pragma once
// The document's LISP interface, as a module sees it.
#include "ResultBuffer.h"

#include <cstdint>
#include <string_view>

namespace zvsdk {

// The text of an entry of a symbol: its handle in upper-case hexadecimal, then
// "#CONNECTION#BLOCK" when `details` (the names in UTF-8).
QString symbolEntryText(std::uint64_t handle, bool details, std::string_view connection,
                        std::string_view block);

// Takes an answer of wires and their entries, ((NUMBER (TEXT x y z) ...) ...), as a host
// hands it over without its chain (see LispInterface::lispInvokeConnections).
class ConnectionReceiver {
public:
    virtual ~ConnectionReceiver() = default;
    // Before anything else: how many wires and entries follow in all.
    virtual void begin(std::size_t wires, std::size_t entries) = 0;
    // A wire, its entries after it.
    virtual void wire(QString number) = 0;
    // The same for a number in UTF-8, as the host holds it: a receiver that keeps its own
    // copy makes no QString. The default makes the QString for wire().
    virtual void wireNumber(std::string_view number);
    virtual void entry(QString text, double x, double y, double z) = 0;
    // An entry whose text is symbolEntryText's, in its parts: a receiver that keeps less than
    // the whole text makes only what it keeps. The default makes the text for entry().
    virtual void symbolEntry(std::uint64_t handle, bool details, std::string_view connection,
                             std::string_view block, double x, double y, double z);
};

// Takes an answer of polyline handles, as a host hands it over with the vertices it has of
// each (see LispInterface::lispInvokePolylines).
class PolylineReceiver {
public:
    virtual ~PolylineReceiver() = default;
    // A polyline of the answer, in its order, with its `count` vertices as the drawing holds
    // them: x, y and z of each in turn in `xyz`.
    virtual void polyline(std::uint64_t handle, const double* xyz, std::size_t count) = 0;
};

class LispInterface {
public:
    virtual ~LispInterface() = default;
    // RTNORM and a new chain (the caller frees it), or RTERROR when the symbol is unbound.
    virtual int lispGetSymbol(const QString& name, ResultBuffer** value) = 0;
    // The host copies the chain; the caller keeps its own. A null chain sets nil.
    virtual int lispPutSymbol(const QString& name, const ResultBuffer* value) = 0;
    // Calls the function named by the first node with the rest as arguments. The result
    // chain belongs to the caller; null when the call failed or answered nothing.
    virtual ResultBuffer* lispInvoke(const ResultBuffer* call) = 0;
    // Evaluates LISP text in the document; a failure is printed on the command line.
    virtual bool lispEvaluate(const QString& text) = 0;
    virtual void releaseResultBuffer(ResultBuffer* chain) { releaseChain(chain); }
    // Sets the symbol to an association list of dotted string pairs, in the given order.
    // A list run publishes one item per row this way, so a host may build the list
    // directly, or only when LISP reads it; the default goes through a chain and
    // lispPutSymbol. The caller keeps the texts alive and unchanged until it sets the
    // symbol again (pairs or lispPutSymbol) or publishes pairs under another name.
    virtual int lispPutStringPairs(const QString& name, const StringPair* pairs, int count);
    // RTNORM and, in `first`, the first node of the chain lispGetSymbol would give (its
    // rbnext null), or RTERROR as lispGetSymbol. A module reads template settings and
    // answers this way, some once per item, so a host may skip making the chain; the default
    // makes it.
    virtual int lispGetSymbolFirst(const QString& name, ResultBuffer& first);
    // Calls a function without arguments that answers wires and their entries, the whole
    // drawing's, and hands the answer to `receiver` as the values of its chain, in their
    // order, without making the chain: RTNORM then, RTERROR when the call failed (as
    // lispInvoke's null), RTNONE when the host does not answer the function so (the caller
    // asks lispInvoke). The default answers RTNONE.
    virtual int lispInvokeConnections(const QString& function, ConnectionReceiver& receiver);
    // Tells the host that the caller will call `function` so later, after reading the
    // drawing for a while without changing it: the host may start working out the answer
    // meanwhile, on another thread. True when it did, and the call should then come as late
    // as the caller can make it; false when it did not, and nothing is gained by waiting.
    // The default answers false.
    virtual bool lispPrepareConnections(const QString& function);
    // The same for a function of one text argument that answers polyline handles (such as
    // getFiosPorLayer): each goes to `receiver` with its vertices, which a reader would read
    // next. The default answers RTNONE.
    virtual int lispInvokePolylines(const QString& function, const QString& argument,
                                    PolylineReceiver& receiver);
};

}  // namespace zvsdk
