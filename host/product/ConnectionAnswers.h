#pragma once
// The answers of getConexoesTodosFios and getConexoesTodosCabos for one document. Both come
// from one index of the drawing (ConnectionFinder), and a reader of the module asks for the
// two in a row, or for the wires alone: so its call works out the kind asked for and keeps
// the index for the next call. The kept index serves only while the drawing (its change
// count, see DrawingStamp) and the tolerance are the same, and the next call drops it in
// any case: nothing big stays behind between commands. A host that sees the caller go on
// to other things (see ConnectionChains) lets it go at once.
//
// A reader that asks later may announce its call (prepare): the index is then worked out on
// another thread while the reader goes on reading the drawing, and the call waits for it.
#include "ConnectionFinder.h"
#include "DrawingStamp.h"
#include "WireLayerIndex.h"
#include "WireListIndex.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace zvlisp {
class Interpreter;
}

namespace zvproduct {

struct ProductContext;

class ConnectionAnswers {
public:
    enum class Kind { Wires, Cables };

    ConnectionAnswers();
    ~ConnectionAnswers();
    ConnectionAnswers(const ConnectionAnswers&) = delete;
    ConnectionAnswers& operator=(const ConnectionAnswers&) = delete;

    // Starts working out, on another thread, the index the next two calls on the drawing
    // will use; true when it did. It does not when an index for the drawing as it stands is
    // kept already, when the drawing holds objects whose reading changes them, or when no
    // thread could be had: the calls then work it out themselves. The drawing must not
    // change meanwhile: its next change (Database::settleBeforeChange) waits for the thread
    // and drops what it made, which the drawing's change makes stale anyway.
    // The answer of `kind` is worked out there too when the thread comes to it.
    bool prepare(zvdb::Database& database, double tolerance, Kind kind);
    // The same for the context's drawing, at the tolerance of a LISP call; false without a
    // drawing.
    bool prepare(zvlisp::Interpreter& lisp, const ProductContext& context, Kind kind);
    // Whether an index is being worked out, or was and waits for its calls.
    bool isPrepared() const { return prepared_ != nullptr; }

    // `keepOther` keeps the index for a call of the other kind.
    std::vector<WireConnections> answer(zvdb::Database& database, double tolerance, Kind kind,
                                        bool keepOther = true);
    // The same for a call on the context's drawing, at the tolerance that
    // *ESPESSURA_BARRAMENTO* sets (0.1 unless a positive number); fails the LISP way when
    // there is no drawing.
    std::vector<WireConnections> answer(zvlisp::Interpreter& lisp, const ProductContext& context,
                                        Kind kind, bool keepOther);

    // The same answers as tables (ConnectionFinder::wireTable), from the same kept index,
    // handed to `use` while their index lives.
    using TableUse = std::function<void(const ConnectionTable&)>;
    void table(zvdb::Database& database, double tolerance, Kind kind, bool keepOther,
               const TableUse& use);
    void table(zvlisp::Interpreter& lisp, const ProductContext& context, Kind kind, bool keepOther,
               const TableUse& use);

    // The text of an entry: the symbol's handle in upper-case hexadecimal, with
    // "#CONNECTION#BLOCK" behind it for `details`; appended to `out`.
    static void appendEntryText(const Touch& touch, bool details, std::string& out);
    // What the tolerance of a LISP call is.
    static double tolerance(zvlisp::Interpreter& lisp);
    // Whether an index is kept for the next call.
    bool keepsIndex() const { return kept_ != nullptr; }
    // Lets go of a kept index: the caller has gone on to other things.
    void release() { kept_.reset(); }
    // The wire and lead polylines by layer (getFiosPorLayer): an index walks the same
    // drawing, so each new one hands them over as it stands.
    WireLayerIndex& wireLayers() { return wireLayers_; }
    // The numbered wires in page order (getListaFios, getListaFiosProj), handed over the
    // same way: a reader loads the connections before it lists the wires.
    WireListIndex& wireList() { return wireList_; }
    // The two as the drawing stands. When both are stale they are made from one walk of the
    // drawing: the material list asks for the wires and then for them page by page, with no
    // connection answer in between to hand them over.
    WireLayerIndex& wireLayersOf(zvdb::Database& database);
    WireListIndex& wireListOf(zvdb::Database& database);

private:
    // `ask(finder)` from the kept index or a new one, which is kept after for `keepOther`.
    template <class Ask>
    auto withFinder(zvdb::Database& database, double tolerance, bool keepOther, Ask&& ask);
    static zvdb::Database& databaseOf(zvlisp::Interpreter& lisp, const ProductContext& context);
    void readWires(zvdb::Database& database);

    // The index prepare works out, when it is for `database` as it stands at `tolerance`;
    // null otherwise. What was prepared goes in any case.
    std::unique_ptr<ConnectionFinder> takePrepared(zvdb::Database& database, double tolerance);
    // The same left in place, once its thread is done; what does not serve goes.
    ConnectionFinder* readyPrepared(zvdb::Database& database);
    void dropPrepared();
    // Gives the wire indexes what the walk of `finder` saw, where they are stale.
    void handOver(const ConnectionFinder& finder, zvdb::Database& database);

    struct Prepared;
    std::unique_ptr<Prepared> prepared_;
    DrawingStamp stamp_;
    double tolerance_ = 0;
    std::unique_ptr<ConnectionFinder> kept_;
    WireLayerIndex wireLayers_;
    WireListIndex wireList_;
};

}  // namespace zvproduct
