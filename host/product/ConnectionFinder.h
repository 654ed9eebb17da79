#pragma once
// Works out which symbols each wire and each cable touches, from the drawing alone. The
// symbols' connection points go into a grid of cells keyed by layer and cell, so each
// polyline vertex looks at nine cells: the whole drawing is read in near-linear time.
// The rule is told in docs/project-format.md ("Wires and the connection rule").
//
// One pass over model space gathers the symbols and the wire, lead and blind-connection
// polylines, so the wires and the cables of a drawing cost one walk of the drawing. Texts
// of the answers are views into the drawing's storage: they hold while it is unchanged.
#include "drawing/Geometry.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {
class BlockReference;
class Database;
class Polyline;
}  // namespace zvdb

namespace zvproduct {

struct Touch {
    std::uint64_t symbol = 0;
    std::string_view connection;  // value of the touching connection attribute, or empty
    std::string_view block;
    zvdb::Point3 point;
};

struct WireConnections {
    std::string number;
    std::vector<Touch> touches;            // along the wire from its start
    std::vector<std::uint64_t> polylines;  // page order, then handle order
};

// A wire polyline with its number (empty when it has none) and its layer: views into the
// drawing's storage.
struct WireLine {
    std::uint64_t handle = 0;
    std::string_view number, layer;
    bool operator==(const WireLine&) const = default;
};

// The vertices of a layer's polylines, in the order of its handles: polyline k's are
// counts[k] from points[starts[k]] on, as Polyline::vertices gives them.
struct LayerVertices {
    std::shared_ptr<const std::vector<zvdb::Point3>> points;  // the walk's, shared
    std::vector<std::uint32_t> starts, counts;

    std::span<const zvdb::Point3> of(std::size_t k) const {
        return {points->data() + starts[k], counts[k]};
    }
};

class ConnectionFinder;

// The same answer in a few arrays: wire w's touches are entries[ends[w - 1]] (0 for the
// first wire) to entries[ends[w]], each a place in the finder that made the table, which
// touch(k) turns into the k-th Touch: four bytes an entry, and the table serves while its
// finder lives. The numbers are views into the drawing's storage, or into `owned` (a
// cable's number is made of two texts): a table is moved, not copied.
struct ConnectionTable {
    std::vector<std::string_view> numbers;
    std::vector<std::uint32_t> ends;
    std::vector<std::uint32_t> entries;
    std::vector<std::string> owned;
    const ConnectionFinder* finder = nullptr;

    Touch touch(std::size_t k) const;
};

class ConnectionFinder {
public:
    ConnectionFinder(zvdb::Database& database, double tolerance);
    // The same with the registry's pages in order (pagesInOrder) read beforehand: the walk
    // then reads model space alone, which another thread may do while nothing changes it.
    ConnectionFinder(zvdb::Database& database, double tolerance, std::vector<std::string> pages);
    static std::vector<std::string> pagesInOrder(zvdb::Database& database);

    // Wires (KVR_ZV_WIRE), in the order their first polyline comes in page order.
    std::vector<WireConnections> wires() const;
    // Cables by "NAME\fKEY": the two ends of each lead and the ends of its blind
    // connections, leads in page order (tolerance 0.3).
    std::vector<WireConnections> cables() const;
    // The same as tables, without the polylines: no arrays per wire.
    ConnectionTable wireTable() const;
    ConnectionTable cableTable() const;
    // Works out the wires' (or the cables') table now, on the thread that made the finder:
    // the next wireTable (cableTable) hands it over.
    void tableAhead(bool cables);
    // The touch at a place of a table's entries.
    Touch touchAt(std::uint32_t place) const;
    double tolerance() const { return tolerance_; }
    // The wire and lead polylines (KVR_ZV_WIRE or KVR_ZV_CABO) of each layer, each once, in
    // handle order: what the walk above saw, for those who ask by layer.
    // With `vertices`, their vertices by layer too, from the walk's.
    std::unordered_map<std::string, std::vector<std::uint64_t>> wiresAndLeadsByLayer(
        std::unordered_map<std::string, LayerVertices>* vertices = nullptr) const;
    // The KVR_ZV_WIRE polylines as polylinesInPageOrder gives them, with their numbers as
    // wireNumber reads them: what the walk above saw, for the lists of wires.
    std::vector<WireLine> wireLinesInPageOrder() const;

    // The wire number of a KVR_ZV_WIRE polyline (FIO, WIRE, ALAMBRE or CABO item); empty. A
    // view into the drawing's storage.
    static std::string_view wireNumber(const zvdb::Polyline& polyline);
    // "NAME\fKEY" of a lead: its cable's CABO field and its own key; empty.
    std::string cableNumber(const zvdb::Polyline& lead) const;
    // Model-space polylines with the application's extended data, by registry page order
    // (polylines off the pages last), then by handle.
    static std::vector<zvdb::Polyline*> polylinesInPageOrder(zvdb::Database& database,
                                                             const char* application);
    // What wireLinesInPageOrder and wiresAndLeadsByLayer give, from one walk of the polylines
    // without the connections: for the lists of wires, which ask for both.
    static void readWires(zvdb::Database& database, std::vector<WireLine>& lines,
                          std::unordered_map<std::string, std::vector<std::uint64_t>>& byLayer);

private:
    mutable std::optional<ConnectionTable> ahead_[2];
    struct Symbol {
        std::uint64_t handle;
        std::string_view block;
    };
    // Its cell is worked out from its point where the grid is built, not kept with it.
    struct Spot {
        zvdb::Point3 point;
        std::string_view connection;  // in the drawing's storage
        std::uint32_t symbol;
        std::int32_t layer;
    };
    // A polyline of a role with what orders it.
    struct Line {
        zvdb::Polyline* polyline;
        std::uint64_t handle;
        std::int32_t rank;  // registry page order; off the pages last
        std::int32_t layer;
        std::string_view number;  // a wire's number, read with its roles; empty otherwise
        std::uint32_t firstVertex, vertexCount;  // its vertices in vertices_
    };
    // The run of the places of one layer's cell's spots in members_ (in the order they came),
    // in an open-addressed table: a vertex asks nine cells, most of them empty.
    struct CellRun {
        std::uint64_t cell;
        std::uint32_t begin, end;  // end 0: a free slot
    };
    // Each layer has a table of its own, a power of two long, in grid_: the polylines come
    // page by page, and a page's cells stay in the cache while it is read.
    struct LayerCells {
        std::uint32_t first = 0;
        std::uint32_t mask = 0;  // its size - 1; 0: no spot on the layer, no table
    };
    struct Scratch;
    // A record of a cable with the name it gives, or none.
    struct CableRecord {
        std::uint64_t handle = 0;
        std::string_view name;
    };
    std::string cableNumber(const zvdb::Polyline& lead, CableRecord& last) const;

    void readModelSpace();
    void indexSymbol(const zvdb::BlockReference& reference, std::size_t xdata, std::size_t cutBegin,
                     std::size_t cutEnd);
    void addLine(zvdb::Polyline& polyline, std::size_t xdata, bool wire, bool lead, bool blind,
                 std::string_view number);
    std::span<const zvdb::Point3> verticesOf(const Line& line) const;
    // The places of the lines' vertices appended to `out`, in their order.
    void addVertices(std::span<const Line* const> lines, LayerVertices& out) const;
    void addSpot(std::uint32_t symbol, std::int32_t layer, const zvdb::Point3& p,
                 std::string_view connection);
    std::uint64_t cellKey(long long x, long long y) const;
    std::uint64_t cellOf(const zvdb::Point3& p) const;
    static std::size_t slotOf(std::uint64_t cell);
    const CellRun* run(std::int32_t layer, std::uint64_t cell) const;
    void buildGrid();
    void sortLines(const std::vector<std::string>& pages);
    // The places in spots_ of the touches, appended to `out`.
    void touchesAt(std::int32_t layer, const zvdb::Point3& p, double radius,
                   std::vector<std::uint32_t>& out, Scratch& scratch) const;
    std::int32_t layerId(std::string_view layer);
    // `make(groups, lines, touches, wireStart, addTouches)` given what the wires' (the
    // cables') answer is made of; wireStart: where the wire being read starts in touches.
    template <class Make>
    auto wiresWith(Make&& make) const;
    template <class Make>
    auto cablesWith(Make&& make) const;

    zvdb::Database& database_;
    double tolerance_;
    double cell_;
    std::unordered_map<std::string_view, std::int32_t> layers_;  // views into the drawing
    std::string_view lastLayer_;  // entities come page by page: the last layer asked
    std::int32_t lastLayerId_ = -1;
    std::vector<Symbol> symbols_;
    std::vector<Spot> spots_;
    std::vector<CellRun> grid_;
    std::vector<std::uint32_t> members_;  // places in spots_, cell run by cell run
    std::vector<LayerCells> layerCells_;  // by layer id
    std::vector<Line> wireLines_, leadLines_, blindLines_;
    // The lines' vertices, read on the walk while their tags are at hand; shared with the
    // index of the wires by layer, which outlives the finder.
    std::shared_ptr<std::vector<zvdb::Point3>> vertices_ =
        std::make_shared<std::vector<zvdb::Point3>>();
};

inline Touch ConnectionTable::touch(std::size_t k) const {
    return finder->touchAt(entries[k]);
}

}  // namespace zvproduct
