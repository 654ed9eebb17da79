#include "ConnectionAnswers.h"

#include "ProductContext.h"

#include "lisp/Interpreter.h"

#include <atomic>
#include <charconv>
#include <exception>
#include <system_error>
#include <thread>

namespace zvproduct {

struct ConnectionAnswers::Prepared {
    zvdb::Database* database = nullptr;
    DrawingStamp stamp;
    double tolerance = 0;
    std::unique_ptr<ConnectionFinder> finder;
    std::exception_ptr failure;
    // The tables the thread works out after the index, as announced before it gets there.
    std::atomic<bool> tables[2] = {false, false};
    std::thread thread;
};

ConnectionAnswers::ConnectionAnswers() = default;

ConnectionAnswers::~ConnectionAnswers() {
    dropPrepared();
}

bool ConnectionAnswers::prepare(zvdb::Database& database, double tolerance, Kind kind) {
    // The wires and the cables are announced one after the other: one index serves both.
    if (prepared_ && prepared_->database == &database &&
        prepared_->stamp == DrawingStamp::of(database) && prepared_->tolerance == tolerance) {
        prepared_->tables[int(kind)] = true;
        return true;
    }
    dropPrepared();
    if (kept_ && stamp_ == DrawingStamp::of(database) && tolerance_ == tolerance) return false;
    // Reading a patterned object puts its tags together: not a thing two threads may do.
    if (database.hasPatternedObjects()) return false;
    kept_.reset();  // one index at a time
    auto prepared = std::make_unique<Prepared>();
    prepared->database = &database;
    prepared->stamp = DrawingStamp::of(database);
    prepared->tolerance = tolerance;
    prepared->tables[int(kind)] = true;
    // What the walk would look up in the drawing's dictionaries and tables is looked up
    // here, where the look-ups may keep their indexes; the thread reads model space alone.
    std::vector<std::string> pages = ConnectionFinder::pagesInOrder(database);
    if (!database.modelSpace()) return false;
    Prepared* work = prepared.get();
    try {
        work->thread = std::thread([work, pages = std::move(pages)]() mutable {
            try {
                work->finder = std::make_unique<ConnectionFinder>(*work->database, work->tolerance,
                                                                  std::move(pages));
                for (const bool cables : {false, true})
                    if (work->tables[cables ? 1 : 0]) work->finder->tableAhead(cables);
            } catch (...) {
                work->failure = std::current_exception();
            }
        });
    } catch (const std::system_error&) {
        return false;
    }
    prepared_ = std::move(prepared);
    database.settleBeforeChange(this, [this] { dropPrepared(); });
    return true;
}

bool ConnectionAnswers::prepare(zvlisp::Interpreter& lisp, const ProductContext& context,
                                Kind kind) {
    zvdb::Database* database = context.database ? context.database() : nullptr;
    return database && prepare(*database, tolerance(lisp), kind);
}

ConnectionFinder* ConnectionAnswers::readyPrepared(zvdb::Database& database) {
    if (!prepared_) return nullptr;
    if (prepared_->thread.joinable()) prepared_->thread.join();
    // A failed walk is walked again by the caller, whose failure is then reported.
    if (!prepared_->finder || prepared_->database != &database ||
        prepared_->stamp != DrawingStamp::of(database)) {
        dropPrepared();
        return nullptr;
    }
    return prepared_->finder.get();
}

std::unique_ptr<ConnectionFinder> ConnectionAnswers::takePrepared(zvdb::Database& database,
                                                                  double tolerance) {
    if (!readyPrepared(database)) return nullptr;
    database.forgetSettle(this);
    const std::unique_ptr<Prepared> prepared = std::move(prepared_);
    if (prepared->tolerance != tolerance) return nullptr;
    return std::move(prepared->finder);
}

void ConnectionAnswers::dropPrepared() {
    if (!prepared_) return;
    const std::unique_ptr<Prepared> prepared = std::move(prepared_);
    if (prepared->thread.joinable()) prepared->thread.join();
    prepared->database->forgetSettle(this);
}

void ConnectionAnswers::handOver(const ConnectionFinder& finder, zvdb::Database& database) {
    if (!wireLayers_.current(database)) {
        // The readers read the wires' vertices page by page next: the walk's serve them.
        WireLayerIndex::VerticesByLayer vertices;
        WireLayerIndex::ByLayer byLayer = finder.wiresAndLeadsByLayer(&vertices);
        wireLayers_.adopt(database, std::move(byLayer), std::move(vertices));
    }
    if (!wireList_.current(database)) wireList_.adopt(database, finder.wireLinesInPageOrder());
}

template <class Ask>
auto ConnectionAnswers::withFinder(zvdb::Database& database, double tolerance, bool keepOther,
                                   Ask&& ask) {
    // A prepared index serves as one built now.
    std::unique_ptr<ConnectionFinder> finder = takePrepared(database, tolerance);
    const bool prepared = finder != nullptr;
    if (prepared)
        kept_.reset();
    else
        finder = std::move(kept_);
    // A kept index serves one call: the second of a pair.
    const bool fresh =
        prepared || !finder || stamp_ != DrawingStamp::of(database) || tolerance_ != tolerance;
    if (fresh) {
        if (!prepared) {
            finder.reset();  // before the new one is built: one index at a time
            finder = std::make_unique<ConnectionFinder>(database, tolerance);
        }
        handOver(*finder, database);
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
    // The index a reader announced lists them: the reader waits for it a little earlier.
    if (const ConnectionFinder* prepared = readyPrepared(database))
        return handOver(*prepared, database);
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
