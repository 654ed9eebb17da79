#include "WireListIndex.h"

#include "ConnectionFinder.h"

#include "drawing/Polyline.h"

#include <algorithm>
#include <bit>
#include <functional>

namespace zvproduct {

void WireListIndex::rebuild(zvdb::Database& database) {
    std::vector<WireLine> lines;
    for (zvdb::Polyline* polyline : ConnectionFinder::polylinesInPageOrder(database, "KVR_ZV_WIRE"))
        lines.push_back(
            {polyline->handle(), ConnectionFinder::wireNumber(*polyline), polyline->layer()});
    build(lines);
    stamp_ = DrawingStamp::of(database);
}

void WireListIndex::adopt(const zvdb::Database& database, std::vector<WireLine> lines) {
    firsts_.clear();
    byLayer_.clear();
    handedOver_ = std::move(lines);
    stamp_ = DrawingStamp::of(database);
}

void WireListIndex::build(std::span<const WireLine> lines) {
    firsts_.clear();
    byLayer_.clear();
    // numbers and layers as views into the drawing, which holds still while this runs; the
    // ranks by number in an open-addressed table of rank + 1 (0 a free slot), no node a wire
    const std::size_t mask = std::bit_ceil(std::max<std::size_t>(16, lines.size() * 2)) - 1;
    std::vector<std::uint32_t> slots(mask + 1, 0);
    std::vector<std::string_view> numbers;  // by wire rank
    std::vector<std::uint32_t> placesSeen;  // polylines met so far, by wire rank
    // polylines come page by page: the last layer's entries serve the next polyline
    std::string_view lastLayer;
    std::vector<OnLayer>* onLayer = nullptr;
    for (const WireLine& line : lines) {
        if (line.number.empty()) continue;  // an unnumbered wire is no wire of the lists
        std::size_t slot = std::hash<std::string_view>{}(line.number) & mask;
        while (slots[slot] != 0 && numbers[slots[slot] - 1] != line.number)
            slot = (slot + 1) & mask;
        if (slots[slot] == 0) {
            numbers.push_back(line.number);
            firsts_.push_back(line.handle);
            placesSeen.push_back(0);
            slots[slot] = static_cast<std::uint32_t>(numbers.size());
        }
        const std::uint32_t wire = slots[slot] - 1;
        const std::uint32_t place = placesSeen[wire]++;
        if (!onLayer || line.layer != lastLayer) {
            onLayer = &byLayer_[std::string(line.layer)];
            lastLayer = line.layer;
        }
        // polylines come in page order, so a wire's first one on this layer is the one kept
        if (onLayer->empty() || onLayer->back().wire != wire)
            onLayer->push_back({wire, place, line.handle});
    }
    // within a layer a wire can come back after others; the later entries only repeat it
    for (auto& [layer, entries] : byLayer_) {
        std::stable_sort(entries.begin(), entries.end(),
                         [](const OnLayer& a, const OnLayer& b) { return a.wire < b.wire; });
        entries.erase(
            std::unique(entries.begin(), entries.end(),
                        [](const OnLayer& a, const OnLayer& b) { return a.wire == b.wire; }),
            entries.end());
    }
}

std::vector<std::uint64_t> WireListIndex::firstPolylines(
    zvdb::Database& database, const std::unordered_set<std::string>& layers) {
    if (!current(database)) {
        handedOver_ = {};
        rebuild(database);
    } else if (!handedOver_.empty()) {
        build(handedOver_);
        handedOver_ = {};
    }
    if (layers.empty()) return firsts_;
    std::vector<const std::vector<OnLayer>*> asked;
    for (const std::string& layer : layers) {
        auto entries = byLayer_.find(layer);
        if (entries != byLayer_.end()) asked.push_back(&entries->second);
    }
    // the wire reader names every layer of the drawing: that is every wire
    if (asked.size() == byLayer_.size()) return firsts_;
    std::vector<OnLayer> found;
    for (const std::vector<OnLayer>* entries : asked)
        found.insert(found.end(), entries->begin(), entries->end());
    // a wire on several of the layers answers with its first polyline among them
    std::sort(found.begin(), found.end(), [](const OnLayer& a, const OnLayer& b) {
        return a.wire != b.wire ? a.wire < b.wire : a.place < b.place;
    });
    std::vector<std::uint64_t> handles;
    handles.reserve(found.size());
    for (std::size_t i = 0; i < found.size(); ++i)
        if (i == 0 || found[i].wire != found[i - 1].wire) handles.push_back(found[i].handle);
    return handles;
}

}  // namespace zvproduct
