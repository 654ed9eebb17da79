#include "ConnectionAnswers.h"

#include "ProductContext.h"

#include "lisp/Interpreter.h"

#include <charconv>

namespace zvproduct {

template <class Ask>
auto ConnectionAnswers::withFinder(zvdb::Database& database, double tolerance, bool keepOther,
                                   Ask&& ask) {
    std::unique_ptr<ConnectionFinder> finder = std::move(kept_);
    // A kept index serves one call: the second of a pair.
    const bool fresh = !finder || stamp_ != DrawingStamp::of(database) || tolerance_ != tolerance;
    if (fresh) {
        finder.reset();  // before the new one is built: one index at a time
        finder = std::make_unique<ConnectionFinder>(database, tolerance);
        if (!wireLayers_.current(database)) {
            // The readers read the wires' vertices page by page next: the walk's serve them.
            WireLayerIndex::VerticesByLayer vertices;
            WireLayerIndex::ByLayer byLayer = finder->wiresAndLeadsByLayer(&vertices);
            wireLayers_.adopt(database, std::move(byLayer), std::move(vertices));
        }
        if (!wireList_.current(database)) wireList_.adopt(database, finder->wireLinesInPageOrder());
    }
    auto asked = ask(*finder);
    if (fresh && keepOther) {
        kept_ = std::move(finder);
        stamp_ = DrawingStamp::of(database);
        tolerance_ = tolerance;
    }
    return asked;
}

void ConnectionAnswers::readWires(zvdb::Database& database) {
    // One stale index alone is made again by itself, as it always was.
    if (wireLayers_.current(database) || wireList_.current(database)) return;
    std::vector<WireLine> lines;
    WireLayerIndex::ByLayer byLayer;
    ConnectionFinder::readWires(database, lines, byLayer);
    wireLayers_.adopt(database, std::move(byLayer));
    wireList_.adopt(database, std::move(lines));
}

WireLayerIndex& ConnectionAnswers::wireLayersOf(zvdb::Database& database) {
    readWires(database);
    return wireLayers_;
}

WireListIndex& ConnectionAnswers::wireListOf(zvdb::Database& database) {
    readWires(database);
    return wireList_;
}

std::vector<WireConnections> ConnectionAnswers::answer(zvdb::Database& database, double tolerance,
                                                       Kind kind, bool keepOther) {
    return withFinder(database, tolerance, keepOther, [kind](const ConnectionFinder& finder) {
        return kind == Kind::Wires ? finder.wires() : finder.cables();
    });
}

void ConnectionAnswers::table(zvdb::Database& database, double tolerance, Kind kind, bool keepOther,
                              const TableUse& use) {
    withFinder(database, tolerance, keepOther, [kind, &use](const ConnectionFinder& finder) {
        use(kind == Kind::Wires ? finder.wireTable() : finder.cableTable());
        return true;
    });
}

zvdb::Database& ConnectionAnswers::databaseOf(zvlisp::Interpreter& lisp,
                                              const ProductContext& context) {
    zvdb::Database* database = context.database ? context.database() : nullptr;
    if (!database) lisp.fail("no drawing");
    return *database;
}

std::vector<WireConnections> ConnectionAnswers::answer(zvlisp::Interpreter& lisp,
                                                       const ProductContext& context, Kind kind,
                                                       bool keepOther) {
    return answer(databaseOf(lisp, context), tolerance(lisp), kind, keepOther);
}

void ConnectionAnswers::table(zvlisp::Interpreter& lisp, const ProductContext& context, Kind kind,
                              bool keepOther, const TableUse& use) {
    table(databaseOf(lisp, context), tolerance(lisp), kind, keepOther, use);
}

double ConnectionAnswers::tolerance(zvlisp::Interpreter& lisp) {
    const zvlisp::Value value = lisp.global("*ESPESSURA_BARRAMENTO*");
    return value.isNumber() && lisp.toNumber(value) > 0 ? lisp.toNumber(value) : 0.1;
}

void ConnectionAnswers::appendEntryText(const Touch& touch, bool details, std::string& out) {
    char buffer[24];
    const auto end = std::to_chars(buffer, buffer + sizeof buffer, touch.symbol, 16).ptr;
    for (char* c = buffer; c != end; ++c)
        out += *c >= 'a' && *c <= 'f' ? static_cast<char>(*c - 'a' + 'A') : *c;
    if (!details) return;
    out += '#';
    out += touch.connection;
    out += '#';
    out += touch.block;
}

}  // namespace zvproduct
