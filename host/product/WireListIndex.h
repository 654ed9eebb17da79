#pragma once
// The numbered wires of the drawing for getListaFios and getListaFiosProj: each wire with its
// polylines in page order, gathered in one pass and kept while the drawing is unchanged, so
// the wire, ferrule and material readers asking in turn cost one look-up each.
#include "ConnectionFinder.h"
#include "DrawingStamp.h"

#include <cstdint>
#include <span>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace zvproduct {

class WireListIndex {
public:
    // The first polyline of each wire that has one on `layers` (every wire when empty), wires
    // in the page order of their first polyline.
    std::vector<std::uint64_t> firstPolylines(zvdb::Database& database,
                                              const std::unordered_set<std::string>& layers);
    // Whether the index, or the polylines handed over for it, hold this drawing as it stands.
    bool current(const zvdb::Database& database) const {
        return stamp_ == DrawingStamp::of(database);
    }
    // Takes the drawing's wire polylines in page order (ConnectionFinder::wireLinesInPageOrder)
    // from someone who walked the drawing as it stands anyway. They are sorted into the index
    // at the first question: a command that asks none pays for the copy alone.
    void adopt(const zvdb::Database& database, std::vector<WireLine> lines);

private:
    // A wire's first polyline on a layer: the wire's rank and the polyline's place in it.
    struct OnLayer {
        std::uint32_t wire;
        std::uint32_t place;
        std::uint64_t handle;
    };
    void rebuild(zvdb::Database& database);
    void build(std::span<const WireLine> lines);

    DrawingStamp stamp_;
    std::vector<WireLine> handedOver_;                               // not yet sorted in
    std::vector<std::uint64_t> firsts_;                              // by wire rank
    std::unordered_map<std::string, std::vector<OnLayer>> byLayer_;  // by wire rank
};

}  // namespace zvproduct
