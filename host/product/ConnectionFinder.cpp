#include "ConnectionFinder.h"

#include "PageRegistry.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Polyline.h"
#include "drawing/TagList.h"
#include "drawing/TagValues.h"

#include <algorithm>
#include <bit>
#include <climits>
#include <cmath>
#include <span>
#include <type_traits>
#include <typeinfo>
#include <utility>

namespace zvproduct {

namespace {

constexpr double kLeadTolerance = 0.3;

char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

// `prefix` is upper-case ASCII: no locale can make another byte one of its letters.
bool startsWithNoCase(std::string_view text, std::string_view prefix) {
    if (text.size() < prefix.size()) return false;
    for (std::size_t i = 0; i < prefix.size(); ++i)
        if (upper(text[i]) != prefix[i]) return false;
    return true;
}

bool isConnectionTag(std::string_view tag) {
    return startsWithNoCase(tag, "LIGACAO") || startsWithNoCase(tag, "CONNECTION") ||
           startsWithNoCase(tag, "CONEXION");
}

// TagValues::toReal. A flat drawing's z are all "0.0": they are not parsed.
double real(std::string_view text) {
    return text == "0.0" ? 0.0 : zvdb::TagValues::toReal(text);
}

double distance(const zvdb::Point3& a, const zvdb::Point3& b) {
    const zvdb::Point3 d = a - b;
    return std::sqrt(d.x * d.x + d.y * d.y + d.z * d.z);
}

// Value of "NAME\fVALUE\f..." when the name is one of `names`, ignoring case; empty.
std::string_view fieldValue(std::string_view item, std::initializer_list<std::string_view> names) {
    const auto sep = item.find('\f');
    if (sep == std::string_view::npos) return {};
    const std::string_view name = item.substr(0, sep);
    if (std::none_of(names.begin(), names.end(),
                     [&](std::string_view n) { return zvdb::TagValues::sameName(name, n); }))
        return {};
    const std::string_view value = item.substr(sep + 1);
    return value.substr(0, value.find('\f'));
}

// The items of the application's first extended-data group of an object, Xrecords included
// (their data may hold codes of the 1000 range, so the groups are found by their 1001 name).
std::span<const zvdb::Tag> appItems(const zvdb::DbObject& object, std::string_view application) {
    const auto all = object.tags();
    for (std::size_t i = 0; i < all.size(); ++i) {
        if (all[i].code != 1001 || !zvdb::TagValues::sameName(all[i].value, application)) continue;
        std::size_t end = i + 1;
        while (end < all.size() && all[end].code != 1001)
            ++end;
        return all.subspan(i + 1, end - i - 1);
    }
    return {};
}

// A view into the drawing's storage.
std::string_view wireNumberOf(std::span<const zvdb::Tag> items) {
    for (std::size_t i = 2; i < items.size(); ++i) {
        const std::string_view value =
            fieldValue(items[i].value, {"CABO", "FIO", "WIRE", "ALAMBRE"});
        if (!value.empty()) return value;
    }
    return {};
}

// `name` is `upperName` ignoring case; `upperName` is upper case.
bool sameUpper(std::string_view name, std::string_view upperName) {
    if (name.size() != upperName.size()) return false;
    for (std::size_t i = 0; i < name.size(); ++i)
        if (upper(name[i]) != upperName[i]) return false;
    return true;
}

// The applications that decide what a model-space entity is to the connection rule, with
// the items of the first group of each, and where the extended data starts
// (TagList::xdataStart): one walk over the entity's extended data, from its end.
struct Roles {
    enum App { Symbol, Equipment, CutPoints, Wire, Cable, Blind, Count };
    std::size_t begin[Count] = {};
    std::size_t end[Count] = {};
    bool has[Count] = {};
    std::size_t xdata = 0;

    // Every entity of model space passes here with all its applications: the names are
    // told apart by their length first, and compared as they are nearly always written.
    static int appOf(std::string_view name) {
        auto is = [name](std::string_view upperName) {
            return name == upperName || sameUpper(name, upperName);
        };
        switch (name.size()) {
            case 6:
                return is("KVR_ZV") ? Symbol : -1;
            case 11:
                return is("KVR_ZV_WIRE") ? Wire : is("KVR_ZV_CABO") ? Cable : -1;
            case 13:
                return is("KVR_ZV_EQUIPO") ? Equipment : -1;
            case 16:
                return is("KVR_ZV_PTS_CORTE") ? CutPoints : -1;
            case 18:
                return is("KVR_ZV_CONEX_BLIND") ? Blind : -1;
            default:
                return -1;
        }
    }

    // The extended data is the run of codes 1000 and above at the end, from its first 1001
    // on; a group ends where the next one starts. Walked backwards, an application's first
    // group is the last one met.
    explicit Roles(const zvdb::DbObject& object) {
        const auto all = object.tags();
        xdata = all.size();
        for (std::size_t i = all.size(); i > 1 && all[i - 1].code >= 1000; --i) {
            if (all[i - 1].code != 1001) continue;
            const int app = appOf(all[i - 1].value);
            if (app >= 0) {
                has[app] = true;
                begin[app] = i;
                end[app] = xdata;
            }
            xdata = i - 1;
        }
    }
    std::span<const zvdb::Tag> items(const zvdb::DbObject& object, App app) const {
        return has[app] ? object.tags().subspan(begin[app], end[app] - begin[app])
                        : std::span<const zvdb::Tag>();
    }
};

// The first tags of codes 1, 2, 8 and 10 of an object, outside application groups and
// before the extended data, as DbObject::text and point find them, in one walk instead
// of one walk each; the walk stops when the codes `wanted` are found.
struct FirstTags {
    enum Code : unsigned { Value = 1, Name = 2, Layer = 4, Point = 8 };
    static constexpr std::uint64_t kCodes = 1u << 1 | 1u << 2 | 1u << 8 | 1u << 10;
    std::span<const zvdb::Tag> all;
    int value = -1, name = -1, layer = -1, point = -1;

    // `end`: where the extended data starts, or past it (the extended data holds codes of
    // 1000 and above only).
    FirstTags(std::span<const zvdb::Tag> tags, unsigned wanted, std::size_t end) : all(tags) {
        bool inGroup = false;
        unsigned found = 0;
        for (std::size_t i = 1; i < end; ++i) {
            const zvdb::Tag& tag = all[i];
            // most tags have none of the codes looked at: one test passes them
            const auto number = static_cast<std::uint16_t>(tag.code);
            if (number < 64 ? ((kCodes >> number) & 1) == 0 : number != 102) continue;
            if (tag.code == 102) {
                if (zvdb::TagList::opensGroup(tag)) inGroup = true;
                if (zvdb::TagList::closesGroup(tag)) inGroup = false;
                continue;
            }
            if (inGroup) continue;
            int* slot;
            unsigned code;
            switch (tag.code) {
                case 1:
                    slot = &value, code = Value;
                    break;
                case 2:
                    slot = &name, code = Name;
                    break;
                case 8:
                    slot = &layer, code = Layer;
                    break;
                case 10:
                    slot = &point, code = Point;
                    break;
                default:
                    continue;
            }
            if (*slot >= 0) continue;
            *slot = static_cast<int>(i);
            found |= code;
            if ((found & wanted) == wanted) break;
        }
    }
    std::string_view text(int at, std::string_view fallback = {}) const {
        return at < 0 ? fallback : all[static_cast<std::size_t>(at)].value;
    }
    zvdb::Point3 position() const {
        if (point < 0) return {};
        auto k = static_cast<std::size_t>(point);
        zvdb::Point3 p{real(all[k++].value), 0.0, 0.0};
        if (k < all.size() && all[k].code == 20) p.y = real(all[k++].value);
        if (k < all.size() && all[k].code == 30) p.z = real(all[k].value);
        return p;
    }
};

// `items` by rank (0 to `pages` - 1, INT_MAX off the pages, last), then by handle: the
// items go to their rank's place in one pass, and then by handle within it, in which order
// most of them come already. `sorted` is where they are put, reused between calls.
template <class T, class Rank, class Handle>
void byRankThenHandle(std::vector<T>& items, std::size_t pages, std::vector<T>& sorted, Rank rank,
                      Handle handle) {
    auto place = [&](const T& item) {
        const std::int32_t r = rank(item);
        return r == INT_MAX ? pages : static_cast<std::size_t>(r);
    };
    std::vector<std::size_t> ends(pages + 1, 0);
    for (const T& item : items)
        ++ends[place(item)];
    std::size_t next = 0;
    for (std::size_t& end : ends)
        next = std::exchange(end, next) + next;  // ends[r]: where rank r starts, for now
    sorted.resize(items.size());
    for (const T& item : items)
        sorted[ends[place(item)]++] = item;  // then where it ends
    auto byHandle = [&](const T& a, const T& b) { return handle(a) < handle(b); };
    std::size_t begin = 0;
    for (const std::size_t end : ends) {
        const auto first = sorted.begin() + static_cast<std::ptrdiff_t>(begin);
        const auto last = sorted.begin() + static_cast<std::ptrdiff_t>(end);
        if (!std::is_sorted(first, last, byHandle)) std::sort(first, last, byHandle);
        begin = end;
    }
    items.swap(sorted);
}

}  // namespace

// What one vertex query needs, kept between queries so that they allocate nothing.
struct ConnectionFinder::Scratch {
    std::vector<const Spot*> near;
    std::vector<std::uint32_t> seen;
    std::vector<std::uint32_t> touches;
    std::size_t wireStart = 0;  // the touches before it are another wire's
};

namespace {

// The vertices of a polyline as Polyline::vertices gives them, appended to `out`, and its
// layer as Entity::layer reads it: a lightweight polyline's in one walk of its tags up to
// `end`, where its extended data starts (its elevation, the first 38 outside application
// groups, is the z of all), without a vector made per polyline.
std::string_view appendVertices(const zvdb::Polyline& polyline, std::size_t end,
                                std::vector<zvdb::Point3>& out) {
    if (!polyline.isLightweight()) {
        const std::vector<zvdb::Point3> points = polyline.vertices();
        out.insert(out.end(), points.begin(), points.end());
        return polyline.layer();
    }
    const auto all = polyline.tags();
    const std::size_t first = out.size();
    int elevation = -1, layer = -1;
    bool inGroup = false;
    for (std::size_t i = 1; i < end; ++i) {
        const zvdb::Tag& tag = all[i];
        if (tag.code == 10) {
            out.push_back({zvdb::TagValues::toReal(tag.value), 0.0, 0.0});
        } else if (tag.code == 20) {
            if (out.size() > first) out.back().y = zvdb::TagValues::toReal(tag.value);
        } else if (zvdb::TagList::opensGroup(tag)) {
            inGroup = true;
        } else if (zvdb::TagList::closesGroup(tag)) {
            inGroup = false;
        } else if (tag.code == 38 && !inGroup && elevation < 0) {
            elevation = static_cast<int>(i);
        } else if (tag.code == 8 && !inGroup && layer < 0) {
            layer = static_cast<int>(i);
        }
    }
    if (elevation >= 0) {
        const double z = real(all[static_cast<std::size_t>(elevation)].value);
        for (std::size_t k = first; k < out.size(); ++k)
            out[k].z = z;
    }
    return layer < 0 ? std::string_view("0") : all[static_cast<std::size_t>(layer)].value;
}

}  // namespace

ConnectionFinder::ConnectionFinder(zvdb::Database& database, double tolerance)
    : ConnectionFinder(database, tolerance, pagesInOrder(database)) {}

ConnectionFinder::ConnectionFinder(zvdb::Database& database, double tolerance,
                                   std::vector<std::string> pages)
    : database_(database),
      tolerance_(tolerance > 0 ? tolerance : 0.1),
      cell_(std::max({tolerance_, kLeadTolerance, 1.0})) {
    readModelSpace();
    buildGrid();
    sortLines(pages);
}

std::vector<std::string> ConnectionFinder::pagesInOrder(zvdb::Database& database) {
    return PageRegistry(database).pages();
}

std::unordered_map<std::string, std::vector<std::uint64_t>> ConnectionFinder::wiresAndLeadsByLayer(
    std::unordered_map<std::string, LayerVertices>* vertices) const {
    std::vector<std::vector<const Line*>> byId(layers_.size());
    for (const std::vector<Line>* lines : {&wireLines_, &leadLines_})
        for (const Line& line : *lines)
            byId[static_cast<std::size_t>(line.layer)].push_back(&line);
    const auto byHandle = [](const Line* a, const Line* b) { return a->handle < b->handle; };
    const auto sameHandle = [](const Line* a, const Line* b) { return a->handle == b->handle; };
    std::unordered_map<std::string, std::vector<std::uint64_t>> byLayer;
    for (const auto& [name, id] : layers_) {
        std::vector<const Line*>& lines = byId[static_cast<std::size_t>(id)];
        if (lines.empty()) continue;
        // A polyline that is both a wire and a lead came in both lists.
        std::sort(lines.begin(), lines.end(), byHandle);
        lines.erase(std::unique(lines.begin(), lines.end(), sameHandle), lines.end());
        std::vector<std::uint64_t>& handles = byLayer[std::string(name)];
        handles.reserve(lines.size());
        for (const Line* line : lines)
            handles.push_back(line->handle);
        if (vertices) addVertices(lines, (*vertices)[std::string(name)]);
    }
    return byLayer;
}

void ConnectionFinder::addVertices(std::span<const Line* const> lines, LayerVertices& out) const {
    out.points = vertices_;
    out.starts.reserve(lines.size());
    out.counts.reserve(lines.size());
    for (const Line* line : lines) {
        out.starts.push_back(line->firstVertex);
        out.counts.push_back(line->vertexCount);
    }
}

std::vector<WireLine> ConnectionFinder::wireLinesInPageOrder() const {
    std::vector<std::string_view> names(layers_.size());
    for (const auto& [name, id] : layers_)
        names[static_cast<std::size_t>(id)] = name;
    std::vector<WireLine> lines;
    lines.reserve(wireLines_.size());
    for (const Line& line : wireLines_)
        lines.push_back({line.handle, line.number, names[static_cast<std::size_t>(line.layer)]});
    return lines;
}

std::int32_t ConnectionFinder::layerId(std::string_view layer) {
    if (lastLayerId_ >= 0 && layer == lastLayer_) return lastLayerId_;
    lastLayer_ = layer;
    lastLayerId_ = layers_.emplace(layer, static_cast<std::int32_t>(layers_.size())).first->second;
    return lastLayerId_;
}

std::uint64_t ConnectionFinder::cellKey(long long x, long long y) const {
    return (static_cast<std::uint64_t>(x) << 32) ^ (static_cast<std::uint64_t>(y) & 0xFFFFFFFF);
}

void ConnectionFinder::addSpot(std::uint32_t symbol, std::int32_t layer, const zvdb::Point3& p,
                               std::string_view connection) {
    spots_.push_back({p, connection, symbol, layer});
}

std::uint64_t ConnectionFinder::cellOf(const zvdb::Point3& p) const {
    const auto cx = static_cast<long long>(std::floor(p.x / cell_));
    const auto cy = static_cast<long long>(std::floor(p.y / cell_));
    return cellKey(cx, cy);
}

// The symbols (KVR_ZV or KVR_ZV_EQUIPO references) and the polylines of the wires, the
// cable leads and the blind connections, in model-space order.
void ConnectionFinder::readModelSpace() {
    // Walked in place: a list of the entities first would touch each one an extra time, and
    // a large drawing's objects are out of the cache again by the time the walk comes to them.
    // The room is for every entity made, erased ones too: room not used is never touched.
    const std::size_t entities = database_.modelSpace()->entitiesMade();
    symbols_.reserve(entities / 2);
    spots_.reserve(entities);
    // about one vertex an entity: the lines have two or three, and most entities are symbols
    vertices_->reserve(entities);
    database_.modelSpace()->forEachEntity([this](zvdb::Entity& entity) {
        const Roles roles(entity);
        // no kind of reference or polyline derives from their classes: the type tells them
        const std::type_info& type = typeid(entity);
        if ((roles.has[Roles::Symbol] || roles.has[Roles::Equipment]) &&
            type == typeid(zvdb::BlockReference)) {
            indexSymbol(static_cast<const zvdb::BlockReference&>(entity), roles.xdata,
                        roles.begin[Roles::CutPoints],
                        roles.has[Roles::CutPoints] ? roles.end[Roles::CutPoints] : 0);
            return;
        }
        if (!roles.has[Roles::Wire] && !roles.has[Roles::Cable] && !roles.has[Roles::Blind]) return;
        if (type != typeid(zvdb::Polyline)) return;
        auto& polyline = static_cast<zvdb::Polyline&>(entity);
        addLine(polyline, roles.xdata, roles.has[Roles::Wire], roles.has[Roles::Cable],
                roles.has[Roles::Blind], wireNumberOf(roles.items(polyline, Roles::Wire)));
    });
}

// A polyline of the roles given, with its vertices.
void ConnectionFinder::addLine(zvdb::Polyline& polyline, std::size_t xdata, bool wire, bool lead,
                               bool blind, std::string_view number) {
    const auto firstVertex = static_cast<std::uint32_t>(vertices_->size());
    const std::int32_t layer = layerId(appendVertices(polyline, xdata, *vertices_));
    const auto vertexCount = static_cast<std::uint32_t>(vertices_->size() - firstVertex);
    Line line{&polyline, polyline.handle(), 0, layer, {}, firstVertex, vertexCount};
    if (wire) {
        line.number = number;
        wireLines_.push_back(line);
        line.number = {};
    }
    if (lead) leadLines_.push_back(line);
    if (blind) blindLines_.push_back(line);
}

std::span<const zvdb::Point3> ConnectionFinder::verticesOf(const Line& line) const {
    return {vertices_->data() + line.firstVertex, line.vertexCount};
}

// A project symbol gives its connection attributes' text positions, its insertion point and
// its cut point; the two latter take the name of a connection attribute standing on them.
void ConnectionFinder::indexSymbol(const zvdb::BlockReference& reference, std::size_t xdata,
                                   std::size_t cutBegin, std::size_t cutEnd) {
    const FirstTags own(reference.tags(), FirstTags::Name | FirstTags::Layer | FirstTags::Point,
                        xdata);
    const std::int32_t layer = layerId(own.text(own.layer, "0"));
    const auto symbol = static_cast<std::uint32_t>(symbols_.size());
    symbols_.push_back({reference.handle(), own.text(own.name)});
    const std::size_t firstSpot = spots_.size();
    for (zvdb::Entity* sub : reference.subEntities()) {
        // no kind of attribute derives from Attribute: its type tells it at once
        if (sub->isErased() || typeid(*sub) != typeid(zvdb::Attribute)) continue;
        // the extended data holds codes of 1000 and above only: the walk may run over it
        const auto tags = sub->tags();
        const FirstTags attribute(tags, FirstTags::Value | FirstTags::Name | FirstTags::Point,
                                  tags.size());
        if (isConnectionTag(attribute.text(attribute.name)))
            addSpot(symbol, layer, attribute.position(), attribute.text(attribute.value));
    }
    const std::size_t named = spots_.size();
    zvdb::Point3 ends[2] = {own.position(), {}};
    int endCount = 1;
    // the cut point: the second point of KVR_ZV_PTS_CORTE
    const auto all = reference.tags();
    int points = 0;
    for (std::size_t i = cutBegin; cutEnd > 0 && i + 2 < cutEnd; ++i)
        if (all[i].code == 1010 && ++points == 2) {
            ends[1] = {real(all[i].value), real(all[i + 1].value), real(all[i + 2].value)};
            endCount = 2;
            break;
        }
    for (int e = 0; e < endCount; ++e) {
        bool onNamed = false;
        for (std::size_t s = firstSpot; s < named && !onNamed; ++s)
            onNamed = distance(spots_[s].point, ends[e]) < tolerance_;
        if (!onNamed) addSpot(symbol, layer, ends[e], {});
    }
}

std::size_t ConnectionFinder::slotOf(std::uint64_t cell) {
    std::uint64_t h = cell * 0x9E3779B97F4A7C15ull;
    h ^= h >> 29;
    h *= 0xBF58476D1CE4E5B9ull;
    h ^= h >> 32;
    return static_cast<std::size_t>(h);
}

const ConnectionFinder::CellRun* ConnectionFinder::run(std::int32_t layer,
                                                       std::uint64_t cell) const {
    const auto id = static_cast<std::size_t>(layer);
    if (id >= layerCells_.size() || layerCells_[id].mask == 0) return nullptr;
    const LayerCells& table = layerCells_[id];
    for (std::size_t slot = slotOf(cell) & table.mask;; slot = (slot + 1) & table.mask) {
        const CellRun& run = grid_[table.first + slot];
        if (run.end == 0) return nullptr;
        if (run.cell == cell) return &run;
    }
}

// Each layer's table has room for twice its spots, more than its cells. The spots are counted
// into the slots of their cells, each cell's run follows the one before in the slots' order,
// and the spots' places go to their runs in the order they came: a vertex then finds its
// cells' spots in a run each, without a sort. The spots stay in the drawing's order, in which
// the answers read them: a wire's symbols lie near each other there.
void ConnectionFinder::buildGrid() {
    std::vector<std::uint32_t> counts(layers_.size(), 0);
    for (const Spot& spot : spots_)
        ++counts[static_cast<std::size_t>(spot.layer)];
    layerCells_.assign(layers_.size(), LayerCells{});
    std::size_t size = 0;
    for (std::size_t layer = 0; layer < counts.size(); ++layer) {
        if (counts[layer] == 0) continue;
        const std::size_t own = std::bit_ceil(std::max<std::size_t>(4, counts[layer] * 2));
        layerCells_[layer] = {static_cast<std::uint32_t>(size),
                              static_cast<std::uint32_t>(own - 1)};
        size += own;
    }
    // each spot's slot, its cell's count in `end` until the runs are laid out
    grid_.assign(size, CellRun{0, 0, 0});
    std::vector<std::uint32_t> slots(spots_.size());
    for (std::size_t i = 0; i < spots_.size(); ++i) {
        const Spot& spot = spots_[i];
        const std::uint64_t cell = cellOf(spot.point);
        const LayerCells& table = layerCells_[static_cast<std::size_t>(spot.layer)];
        std::size_t slot = slotOf(cell) & table.mask;
        while (grid_[table.first + slot].end != 0 && grid_[table.first + slot].cell != cell)
            slot = (slot + 1) & table.mask;
        CellRun& run = grid_[table.first + slot];
        run.cell = cell;
        ++run.end;
        slots[i] = static_cast<std::uint32_t>(table.first + slot);
    }
    std::uint32_t next = 0;
    for (CellRun& run : grid_) {
        if (run.end == 0) continue;
        const std::uint32_t count = run.end;
        run.begin = run.end = next;  // `end` is where its next spot goes, for now
        next += count;
    }
    members_.resize(spots_.size());
    for (std::uint32_t i = 0; i < spots_.size(); ++i)
        members_[grid_[slots[i]].end++] = i;
}

// Each role's polylines by registry page order, then by handle.
void ConnectionFinder::sortLines(const std::vector<std::string>& pages) {
    std::unordered_map<std::string_view, std::int32_t> order;
    std::int32_t index = 0;
    for (const std::string& page : pages)
        order.emplace(page, index++);
    std::vector<std::int32_t> rankOf(layers_.size(), INT_MAX);
    for (const auto& [name, id] : layers_) {
        auto page = order.find(name);
        if (page != order.end()) rankOf[static_cast<std::size_t>(id)] = page->second;
    }
    std::vector<Line> sorted;
    for (std::vector<Line>* lines : {&wireLines_, &leadLines_, &blindLines_}) {
        for (Line& line : *lines)
            line.rank = rankOf[static_cast<std::size_t>(line.layer)];
        byRankThenHandle(
            *lines, static_cast<std::size_t>(index), sorted,
            [](const Line& line) { return line.rank; },
            [](const Line& line) { return line.handle; });
    }
}

// One touch per symbol near the vertex, at the symbol's nearest point, nearest first.
void ConnectionFinder::touchesAt(std::int32_t layer, const zvdb::Point3& p, double radius,
                                 std::vector<std::uint32_t>& out, Scratch& scratch) const {
    auto& near = scratch.near;
    near.clear();
    // nothing is within a distance of a point that is not finite
    if (!std::isfinite(p.x) || !std::isfinite(p.y)) return;
    // The radius is at most a cell: the spots lie in the vertex's cell and its neighbours,
    // and only in those that the radius reaches (with a margin far above any rounding),
    // which are visited in the same order.
    auto cells = [&](double v, long long& from, long long& to) {
        const auto at = static_cast<long long>(std::floor(v / cell_));
        const double margin = radius + 1e-6 * (radius + std::abs(v));
        from = std::max(at - 1, static_cast<long long>(std::floor((v - margin) / cell_)));
        to = std::min(at + 1, static_cast<long long>(std::floor((v + margin) / cell_)));
    };
    long long x0, x1, y0, y1;
    cells(p.x, x0, x1);
    cells(p.y, y0, y1);
    for (long long cx = x0; cx <= x1; ++cx)
        for (long long cy = y0; cy <= y1; ++cy) {
            const CellRun* cell = run(layer, cellKey(cx, cy));
            if (!cell) continue;
            for (std::uint32_t i = cell->begin; i < cell->end; ++i) {
                const Spot& spot = spots_[members_[i]];
                if (distance(spot.point, p) <= radius) near.push_back(&spot);
            }
        }
    if (near.empty()) return;
    // Equals stay in the order they were found. A vertex touches a few spots: they are
    // sorted in place, without the merge sort's buffer.
    auto before = [&](const Spot* a, const Spot* b) {
        const double da = distance(a->point, p), db = distance(b->point, p);
        if (da != db) return da < db;
        return symbols_[a->symbol].handle < symbols_[b->symbol].handle;
    };
    if (near.size() > 16) {
        std::stable_sort(near.begin(), near.end(), before);
    } else {
        for (std::size_t i = 1; i < near.size(); ++i)
            for (std::size_t k = i; k > 0 && before(near[k], near[k - 1]); --k)
                std::swap(near[k], near[k - 1]);
    }
    auto& seen = scratch.seen;
    seen.clear();
    for (const Spot* spot : near) {
        if (std::find(seen.begin(), seen.end(), spot->symbol) != seen.end()) continue;
        seen.push_back(spot->symbol);
        // two vertices on one point of a symbol are one touch
        if (out.size() > scratch.wireStart) {
            const Spot& last = spots_[out.back()];
            if (symbols_[last.symbol].handle == symbols_[spot->symbol].handle &&
                last.connection == spot->connection && last.point == spot->point)
                continue;
        }
        out.push_back(static_cast<std::uint32_t>(spot - spots_.data()));
    }
}

Touch ConnectionFinder::touchAt(std::uint32_t place) const {
    const Spot& spot = spots_[place];
    const Symbol& symbol = symbols_[spot.symbol];
    return {symbol.handle, spot.connection, symbol.block, spot.point};
}

std::vector<zvdb::Polyline*> ConnectionFinder::polylinesInPageOrder(zvdb::Database& database,
                                                                    const char* application) {
    const auto pages = PageRegistry(database).pages();
    std::unordered_map<std::string_view, int> order;
    for (std::size_t i = 0; i < pages.size(); ++i)
        order.emplace(pages[i], static_cast<int>(i));
    std::vector<std::pair<std::pair<int, std::uint64_t>, zvdb::Polyline*>> found;
    // entities come page by page: the rank of the last layer serves the next polyline
    std::string_view lastLayer;
    int lastRank = -1;
    // walked in place: a list of the entities first would touch each one an extra time
    database.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        // no kind of polyline derives from Polyline: its type tells it at once
        if (typeid(entity) != typeid(zvdb::Polyline)) return;
        auto* polyline = static_cast<zvdb::Polyline*>(&entity);
        if (!polyline->hasXData(application)) return;
        const std::string_view layer = polyline->layer();
        if (lastRank < 0 || layer != lastLayer) {
            auto page = order.find(layer);
            lastLayer = layer;
            lastRank = page == order.end() ? INT_MAX : page->second;
        }
        found.push_back({{lastRank, polyline->handle()}, polyline});
    });
    decltype(found) sorted;
    byRankThenHandle(
        found, pages.size(), sorted, [](const auto& item) { return item.first.first; },
        [](const auto& item) { return item.first.second; });
    std::vector<zvdb::Polyline*> result;
    result.reserve(found.size());
    for (const auto& item : found)
        result.push_back(item.second);
    return result;
}

void ConnectionFinder::readWires(
    zvdb::Database& database, std::vector<WireLine>& lines,
    std::unordered_map<std::string, std::vector<std::uint64_t>>& byLayer) {
    const auto pages = PageRegistry(database).pages();
    std::unordered_map<std::string_view, int> order;
    for (std::size_t i = 0; i < pages.size(); ++i)
        order.emplace(pages[i], static_cast<int>(i));
    static constexpr std::string_view kApplications[] = {"KVR_ZV_WIRE", "KVR_ZV_CABO"};
    std::vector<std::pair<int, WireLine>> found;
    byLayer.clear();
    // entities come page by page: the last layer's rank and handles serve the next polyline
    std::string_view lastLayer;
    int lastRank = -1;
    std::vector<std::uint64_t>* onLayer = nullptr;
    // walked in place: a list of the entities first would touch each one an extra time
    database.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        if (typeid(entity) != typeid(zvdb::Polyline)) return;
        std::span<const zvdb::Tag> items[2];
        entity.xdataItemsOf(kApplications, items);
        const bool wire = items[0].data() != nullptr;
        if (!wire && !items[1].data()) return;
        const std::string_view layer = entity.layer();
        if (lastRank < 0 || layer != lastLayer) {
            auto page = order.find(layer);
            lastLayer = layer;
            lastRank = page == order.end() ? INT_MAX : page->second;
            onLayer = &byLayer[std::string(layer)];
        }
        onLayer->push_back(entity.handle());
        if (wire) found.push_back({lastRank, {entity.handle(), wireNumberOf(items[0]), layer}});
    });
    for (auto& [layer, handles] : byLayer)
        std::sort(handles.begin(), handles.end());
    {
        decltype(found) sorted;
        byRankThenHandle(
            found, pages.size(), sorted, [](const auto& item) { return item.first; },
            [](const auto& item) { return item.second.handle; });
    }  // the copy in the drawing's order goes before the lines are made
    lines.clear();
    lines.reserve(found.size());
    for (const auto& item : found)
        lines.push_back(item.second);
}

std::string_view ConnectionFinder::wireNumber(const zvdb::Polyline& polyline) {
    return wireNumberOf(Roles(polyline).items(polyline, Roles::Wire));
}

namespace {

// The numbers of wires (or cables) in the order they first come, each with the places of
// its polylines in that order, in flat arrays: no node and no text made per wire.
struct WireGroups {
    std::vector<std::string_view> numbers;
    std::vector<std::uint32_t> first;  // a wire's lines in `lines`, first[w] to first[w + 1]
    std::vector<std::uint32_t> lines;

    explicit WireGroups(std::span<const std::string_view> lineNumbers) {
        const std::size_t mask =
            std::bit_ceil(std::max<std::size_t>(16, lineNumbers.size() * 2)) - 1;
        std::vector<std::uint32_t> slots(mask + 1, 0);  // a wire's place + 1; 0 free
        std::vector<std::uint32_t> wireOf(lineNumbers.size(), UINT32_MAX);
        std::vector<std::uint32_t> count;
        for (std::size_t line = 0; line < lineNumbers.size(); ++line) {
            const std::string_view number = lineNumbers[line];
            if (number.empty()) continue;  // an unnumbered wire joins nothing
            std::size_t slot = std::hash<std::string_view>{}(number)&mask;
            while (slots[slot] != 0 && numbers[slots[slot] - 1] != number)
                slot = (slot + 1) & mask;
            if (slots[slot] == 0) {
                numbers.push_back(number);
                count.push_back(0);
                slots[slot] = static_cast<std::uint32_t>(numbers.size());
            }
            wireOf[line] = slots[slot] - 1;
            ++count[wireOf[line]];
        }
        first.assign(numbers.size() + 1, 0);
        for (std::size_t w = 0; w < numbers.size(); ++w)
            first[w + 1] = first[w] + count[w];
        lines.resize(first.back());
        std::vector<std::uint32_t> next(first.begin(), first.end() - 1);
        for (std::size_t line = 0; line < wireOf.size(); ++line)
            if (wireOf[line] != UINT32_MAX)
                lines[next[wireOf[line]]++] = static_cast<std::uint32_t>(line);
    }
};

// Group by group, the touches `addTouches` gathers for each of its lines, appended to
// `touches`; `done(g)` after each group.
template <class Line, class AddTouches, class Done>
void eachGroup(const WireGroups& groups, const std::vector<Line>& lines, AddTouches&& addTouches,
               Done&& done) {
    for (std::size_t g = 0; g < groups.numbers.size(); ++g) {
        for (std::uint32_t k = groups.first[g]; k < groups.first[g + 1]; ++k)
            addTouches(lines[groups.lines[k]]);
        done(g);
    }
}

// Group by group, its polylines in their order and its touches: each group's vectors are
// made to size once.
struct MakeConnections {
    const ConnectionFinder& finder;
    template <class Line, class AddTouches>
    std::vector<WireConnections> operator()(const WireGroups& groups,
                                            const std::vector<Line>& lines,
                                            std::vector<std::uint32_t>& touches, std::size_t&,
                                            AddTouches&& addTouches) const {
        std::vector<WireConnections> result(groups.numbers.size());
        touches.clear();
        eachGroup(groups, lines, addTouches, [&](std::size_t g) {
            WireConnections& group = result[g];
            group.number = groups.numbers[g];
            group.polylines.reserve(groups.first[g + 1] - groups.first[g]);
            for (std::uint32_t k = groups.first[g]; k < groups.first[g + 1]; ++k)
                group.polylines.push_back(lines[groups.lines[k]].handle);
            group.touches.reserve(touches.size());
            for (const std::uint32_t place : touches)
                group.touches.push_back(finder.touchAt(place));
            touches.clear();
        });
        return result;
    }
};

// All groups' touches in one array.
struct MakeTable {
    template <class Line, class AddTouches>
    ConnectionTable operator()(const WireGroups& groups, const std::vector<Line>& lines,
                               std::vector<std::uint32_t>& touches, std::size_t& wireStart,
                               AddTouches&& addTouches) const {
        ConnectionTable table;
        table.numbers = groups.numbers;
        table.ends.reserve(groups.numbers.size());
        touches.clear();
        eachGroup(groups, lines, addTouches, [&](std::size_t) {
            table.ends.push_back(static_cast<std::uint32_t>(touches.size()));
            wireStart = touches.size();
        });
        table.entries = std::move(touches);
        return table;
    }
};

}  // namespace

template <class Make>
auto ConnectionFinder::wiresWith(Make&& make) const {
    std::vector<std::string_view> lineNumbers(wireLines_.size());
    for (std::size_t i = 0; i < wireLines_.size(); ++i)
        lineNumbers[i] = wireLines_[i].number;
    const WireGroups groups(lineNumbers);
    lineNumbers = {};
    Scratch scratch;
    return make(groups, wireLines_, scratch.touches, scratch.wireStart, [&](const Line& line) {
        for (const zvdb::Point3& vertex : verticesOf(line))
            touchesAt(line.layer, vertex, tolerance_, scratch.touches, scratch);
    });
}

template <class Make>
auto ConnectionFinder::cablesWith(Make&& make) const {
    // blind connections by the handle of their lead, in their order for each lead
    std::vector<std::pair<std::uint64_t, std::uint32_t>> blinds;
    for (std::size_t i = 0; i < blindLines_.size(); ++i) {
        const zvdb::Polyline& blind = *blindLines_[i].polyline;
        const auto items = Roles(blind).items(blind, Roles::Blind);
        if (items.size() >= 2)
            blinds.push_back(
                {zvdb::TagValues::toHandle(items[1].value), static_cast<std::uint32_t>(i)});
    }
    std::sort(blinds.begin(), blinds.end());
    Scratch scratch;
    auto ends = [&](const Line& line, bool firstToo) {
        const auto vertices = verticesOf(line);
        if (vertices.empty()) return;
        if (firstToo)
            touchesAt(line.layer, vertices.front(), kLeadTolerance, scratch.touches, scratch);
        if (vertices.size() > 1)
            touchesAt(line.layer, vertices.back(), kLeadTolerance, scratch.touches, scratch);
    };
    std::vector<std::string> leadNumbers(leadLines_.size());
    CableRecord last;
    for (std::size_t i = 0; i < leadLines_.size(); ++i)
        leadNumbers[i] = cableNumber(*leadLines_[i].polyline, last);
    const std::vector<std::string_view> views(leadNumbers.begin(), leadNumbers.end());
    const WireGroups groups(views);
    auto answer =
        make(groups, leadLines_, scratch.touches, scratch.wireStart, [&](const Line& lead) {
            ends(lead, true);
            auto own = std::lower_bound(blinds.begin(), blinds.end(),
                                        std::pair<std::uint64_t, std::uint32_t>{lead.handle, 0});
            for (; own != blinds.end() && own->first == lead.handle; ++own)
                ends(blindLines_[own->second], false);
        });
    if constexpr (std::is_same_v<decltype(answer), ConnectionTable>) {
        // the numbers' texts go with the table, where its views point
        answer.owned = std::move(leadNumbers);
        for (std::size_t g = 0; g < answer.numbers.size(); ++g)
            answer.numbers[g] = answer.owned[groups.lines[groups.first[g]]];
    }
    return answer;
}

std::vector<WireConnections> ConnectionFinder::wires() const {
    return wiresWith(MakeConnections{*this});
}

std::vector<WireConnections> ConnectionFinder::cables() const {
    return cablesWith(MakeConnections{*this});
}

ConnectionTable ConnectionFinder::wireTable() const {
    if (std::optional<ConnectionTable>& ahead = ahead_[0]) return *std::exchange(ahead, {});
    ConnectionTable table = wiresWith(MakeTable{});
    table.finder = this;
    return table;
}

ConnectionTable ConnectionFinder::cableTable() const {
    if (std::optional<ConnectionTable>& ahead = ahead_[1]) return *std::exchange(ahead, {});
    ConnectionTable table = cablesWith(MakeTable{});
    table.finder = this;
    return table;
}

void ConnectionFinder::tableAhead(bool cables) {
    ahead_[cables ? 1 : 0] = cables ? cableTable() : wireTable();
}

std::string ConnectionFinder::cableNumber(const zvdb::Polyline& lead) const {
    CableRecord last;
    return cableNumber(lead, last);
}

// The leads of a cable name one record of it first: the name read from the last record
// serves the next lead that names the same.
std::string ConnectionFinder::cableNumber(const zvdb::Polyline& lead, CableRecord& last) const {
    const auto items = Roles(lead).items(lead, Roles::Cable);
    if (items.size() < 2) return {};
    const std::string_view keyText = items[0].value;
    const std::string_view key = keyText.substr(0, keyText.find('\f'));
    auto number = [key](std::string_view name) {
        std::string text;
        text.reserve(name.size() + 1 + key.size());
        return text.append(name).append(1, '\f').append(key);
    };
    for (std::size_t i = 1; i < items.size(); ++i) {
        const std::uint64_t handle = zvdb::TagValues::toHandle(items[i].value);
        if (i == 1 && handle == last.handle && !last.name.empty()) return number(last.name);
        zvdb::DbObject* record = database_.objectByHandle(handle);
        if (!record) continue;
        for (const zvdb::Tag& field : appItems(*record, "KVR_ZV_ATT_VIRTUAL")) {
            const std::string_view name = fieldValue(field.value, {"CABO", "CABLE"});
            if (name.empty()) continue;
            last = {handle, name};
            return number(name);
        }
    }
    return {};
}

}  // namespace zvproduct
