#include "ConnectionFinder.h"

#include "PageRegistry.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Polyline.h"
#include "drawing/TagValues.h"

#include <algorithm>
#include <climits>
#include <cmath>

namespace zvproduct {

namespace {

constexpr double kLeadTolerance = 0.3;

bool startsWithNoCase(std::string_view text, std::string_view prefix) {
    if (text.size() < prefix.size()) return false;
    for (std::size_t i = 0; i < prefix.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(text[i])) != prefix[i]) return false;
    return true;
}

bool isConnectionTag(std::string_view tag) {
    return startsWithNoCase(tag, "LIGACAO") || startsWithNoCase(tag, "CONNECTION") ||
           startsWithNoCase(tag, "CONEXION");
}

double distance(const zvdb::Point3& a, const zvdb::Point3& b) {
    const zvdb::Point3 d = a - b;
    return std::sqrt(d.x * d.x + d.y * d.y + d.z * d.z);
}

std::string upper(std::string_view text) {
    std::string out(text);
    for (char& c : out)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

// Value of "NAME\fVALUE\f..." when the name is one of `names`.
std::string fieldValue(std::string_view item, std::initializer_list<std::string_view> names) {
    const auto sep = item.find('\f');
    if (sep == std::string_view::npos) return {};
    const std::string name = upper(item.substr(0, sep));
    if (std::find(names.begin(), names.end(), name) == names.end()) return {};
    std::string_view value = item.substr(sep + 1);
    return std::string(value.substr(0, value.find('\f')));
}

// Extended data of any object, Xrecords included (their data may hold codes of the 1000
// range, so the groups are found by their 1001 name).
std::vector<zvdb::Tag> appItems(const zvdb::DbObject& object, std::string_view application) {
    std::vector<zvdb::Tag> items;
    bool in = false;
    for (const zvdb::Tag& tag : object.tags()) {
        if (tag.code == 1001) {
            if (in) break;
            in = upper(tag.value) == upper(application);
        } else if (in) {
            items.push_back(tag);
        }
    }
    return items;
}

}  // namespace

ConnectionFinder::ConnectionFinder(zvdb::Database& database, double tolerance)
    : database_(database),
      tolerance_(tolerance > 0 ? tolerance : 0.1),
      cell_(std::max({tolerance_, kLeadTolerance, 1.0})) {
    indexSymbols();
    buildGrid();
}

int ConnectionFinder::layerId(const std::string& layer) {
    return layers_.emplace(layer, static_cast<int>(layers_.size())).first->second;
}

std::uint64_t ConnectionFinder::cellKey(long long x, long long y) const {
    return (static_cast<std::uint64_t>(x) << 32) ^ (static_cast<std::uint64_t>(y) & 0xFFFFFFFF);
}

void ConnectionFinder::addSpot(std::uint32_t symbol, int layer, const zvdb::Point3& p,
                               std::string_view connection) {
    const auto cx = static_cast<long long>(std::floor(p.x / cell_));
    const auto cy = static_cast<long long>(std::floor(p.y / cell_));
    spots_.push_back({symbol, layer, cellKey(cx, cy), p, connection});
}

// One sort puts each page's spots together, cell by cell: a page's wires then look at a
// small table of their own.
void ConnectionFinder::buildGrid() {
    std::stable_sort(spots_.begin(), spots_.end(), [](const Spot& a, const Spot& b) {
        return a.layer != b.layer ? a.layer < b.layer : a.cell < b.cell;
    });
    grid_.assign(layers_.size(), {});
    for (std::uint32_t i = 0; i < spots_.size();) {
        std::uint32_t end = i + 1;
        while (end < spots_.size() && spots_[end].layer == spots_[i].layer &&
               spots_[end].cell == spots_[i].cell)
            ++end;
        grid_[static_cast<std::size_t>(spots_[i].layer)].emplace(spots_[i].cell,
                                                                 std::make_pair(i, end));
        i = end;
    }
}

// Every project symbol (KVR_ZV or KVR_ZV_EQUIPO) gives its connection attributes' text
// positions, its insertion point and its cut point; the two latter take the name of a
// connection attribute standing on them.
void ConnectionFinder::indexSymbols() {
    for (zvdb::Entity* entity : database_.modelSpace()->entities()) {
        auto* reference = dynamic_cast<zvdb::BlockReference*>(entity);
        if (!reference || !(reference->hasXData("KVR_ZV") || reference->hasXData("KVR_ZV_EQUIPO")))
            continue;
        const auto symbol = static_cast<std::uint32_t>(symbols_.size());
        symbols_.push_back({reference->handle(), std::string(reference->blockName())});
        const int layer = layerId(std::string(reference->layer()));
        std::vector<std::pair<zvdb::Point3, std::string_view>> named;
        for (zvdb::Attribute* attribute : reference->attributes())
            if (isConnectionTag(attribute->tag()))
                named.emplace_back(attribute->position(), attribute->text(1));
        std::vector<zvdb::Point3> ends = {reference->position()};
        const auto cut = reference->xdata("KVR_ZV_PTS_CORTE");
        std::vector<zvdb::Point3> points;
        for (std::size_t i = 0; i + 2 < cut.size(); ++i)
            if (cut[i].code == 1010)
                points.push_back({zvdb::TagValues::toReal(cut[i].value),
                                  zvdb::TagValues::toReal(cut[i + 1].value),
                                  zvdb::TagValues::toReal(cut[i + 2].value)});
        if (points.size() >= 2) ends.push_back(points[1]);
        for (const auto& [point, name] : named)
            addSpot(symbol, layer, point, name);
        for (const zvdb::Point3& end : ends) {
            auto on = std::find_if(named.begin(), named.end(), [&](const auto& n) {
                return distance(n.first, end) < tolerance_;
            });
            if (on == named.end()) addSpot(symbol, layer, end, {});
        }
    }
}

std::vector<const ConnectionFinder::Spot*> ConnectionFinder::spotsNear(int layer,
                                                                       const zvdb::Point3& p,
                                                                       double radius) const {
    std::vector<const Spot*> near;
    if (layer < 0 || static_cast<std::size_t>(layer) >= grid_.size()) return near;
    const CellRuns& cells = grid_[static_cast<std::size_t>(layer)];
    const auto cx = static_cast<long long>(std::floor(p.x / cell_));
    const auto cy = static_cast<long long>(std::floor(p.y / cell_));
    for (long long dx = -1; dx <= 1; ++dx)
        for (long long dy = -1; dy <= 1; ++dy) {
            auto cell = cells.find(cellKey(cx + dx, cy + dy));
            if (cell == cells.end()) continue;
            for (std::uint32_t i = cell->second.first; i < cell->second.second; ++i)
                if (distance(spots_[i].point, p) <= radius) near.push_back(&spots_[i]);
        }
    return near;
}

// One touch per symbol near the vertex, at the symbol's nearest point, nearest first.
void ConnectionFinder::touchesAt(int layer, const zvdb::Point3& p, double radius,
                                 std::vector<Touch>& out) const {
    auto near = spotsNear(layer, p, radius);
    std::stable_sort(near.begin(), near.end(), [&](const Spot* a, const Spot* b) {
        const double da = distance(a->point, p), db = distance(b->point, p);
        if (da != db) return da < db;
        return symbols_[a->symbol].handle < symbols_[b->symbol].handle;
    });
    std::vector<std::uint32_t> seen;
    for (const Spot* spot : near) {
        if (std::find(seen.begin(), seen.end(), spot->symbol) != seen.end()) continue;
        seen.push_back(spot->symbol);
        const Symbol& symbol = symbols_[spot->symbol];
        Touch touch{symbol.handle, std::string(spot->connection), symbol.block, spot->point};
        // two vertices on one point of a symbol are one touch
        if (!out.empty() && out.back().symbol == touch.symbol &&
            out.back().connection == touch.connection && out.back().point == touch.point)
            continue;
        out.push_back(std::move(touch));
    }
}

std::vector<zvdb::Polyline*> ConnectionFinder::polylinesInPageOrder(zvdb::Database& database,
                                                                    const char* application) {
    const auto pages = PageRegistry(database).pages();
    std::unordered_map<std::string, int> order;
    for (std::size_t i = 0; i < pages.size(); ++i)
        order.emplace(pages[i], static_cast<int>(i));
    std::vector<std::pair<std::pair<int, std::uint64_t>, zvdb::Polyline*>> found;
    for (zvdb::Entity* entity : database.modelSpace()->entities()) {
        auto* polyline = dynamic_cast<zvdb::Polyline*>(entity);
        if (!polyline || !polyline->hasXData(application)) continue;
        auto page = order.find(std::string(polyline->layer()));
        const int rank = page == order.end() ? INT_MAX : page->second;
        found.push_back({{rank, polyline->handle()}, polyline});
    }
    std::sort(found.begin(), found.end(),
              [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<zvdb::Polyline*> result;
    result.reserve(found.size());
    for (const auto& item : found)
        result.push_back(item.second);
    return result;
}

std::string ConnectionFinder::wireNumber(const zvdb::Polyline& polyline) {
    const auto items = polyline.xdata("KVR_ZV_WIRE");
    for (std::size_t i = 2; i < items.size(); ++i) {
        std::string value = fieldValue(items[i].value, {"CABO", "FIO", "WIRE", "ALAMBRE"});
        if (!value.empty()) return value;
    }
    return {};
}

std::vector<WireConnections> ConnectionFinder::wires() {
    std::vector<WireConnections> result;
    std::unordered_map<std::string, std::size_t> byNumber;
    for (zvdb::Polyline* polyline : polylinesInPageOrder(database_, "KVR_ZV_WIRE")) {
        std::string number = wireNumber(*polyline);
        if (number.empty()) continue;  // an unnumbered wire joins nothing
        auto [it, added] = byNumber.emplace(number, result.size());
        if (added) result.push_back({number, {}, {}});
        WireConnections& wire = result[it->second];
        wire.polylines.push_back(polyline->handle());
        const int layer = layerId(std::string(polyline->layer()));
        for (const zvdb::Point3& vertex : polyline->vertices())
            touchesAt(layer, vertex, tolerance_, wire.touches);
    }
    return result;
}

std::vector<WireConnections> ConnectionFinder::cables() {
    // blind connections by the handle of their lead
    std::unordered_map<std::uint64_t, std::vector<zvdb::Polyline*>> blinds;
    for (zvdb::Polyline* blind : polylinesInPageOrder(database_, "KVR_ZV_CONEX_BLIND")) {
        const auto items = blind->xdata("KVR_ZV_CONEX_BLIND");
        if (items.size() >= 2) blinds[zvdb::TagValues::toHandle(items[1].value)].push_back(blind);
    }
    auto ends = [&](zvdb::Polyline& line, bool firstToo, std::vector<Touch>& out) {
        const auto vertices = line.vertices();
        if (vertices.empty()) return;
        const int layer = layerId(std::string(line.layer()));
        if (firstToo) touchesAt(layer, vertices.front(), kLeadTolerance, out);
        if (vertices.size() > 1) touchesAt(layer, vertices.back(), kLeadTolerance, out);
    };
    std::vector<WireConnections> result;
    std::unordered_map<std::string, std::size_t> byNumber;
    for (zvdb::Polyline* lead : polylinesInPageOrder(database_, "KVR_ZV_CABO")) {
        const std::string number = cableNumber(*lead);
        if (number.empty()) continue;
        auto [it, added] = byNumber.emplace(number, result.size());
        if (added) result.push_back({number, {}, {}});
        WireConnections& cable = result[it->second];
        cable.polylines.push_back(lead->handle());
        ends(*lead, true, cable.touches);
        for (zvdb::Polyline* blind : blinds[lead->handle()])
            ends(*blind, false, cable.touches);
    }
    return result;
}

std::string ConnectionFinder::cableNumber(const zvdb::Polyline& lead) const {
    const auto items = lead.xdata("KVR_ZV_CABO");
    if (items.size() < 2) return {};
    const std::string_view keyText = items[0].value;
    const std::string key(keyText.substr(0, keyText.find('\f')));
    for (std::size_t i = 1; i < items.size(); ++i) {
        zvdb::DbObject* record =
            database_.objectByHandle(zvdb::TagValues::toHandle(items[i].value));
        if (!record) continue;
        for (const zvdb::Tag& field : appItems(*record, "KVR_ZV_ATT_VIRTUAL")) {
            std::string name = fieldValue(field.value, {"CABO", "CABLE"});
            if (!name.empty()) return name + '\f' + key;
        }
    }
    return {};
}

}  // namespace zvproduct
