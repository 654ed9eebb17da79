#pragma once
// The wire and lead polylines of each layer, gathered in one pass and kept while the drawing
// is unchanged: the readers ask for every page in turn, and each answer is then a look-up.
#include "DrawingStamp.h"

#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

namespace zvproduct {

class WireLayerIndex {
public:
    using ByLayer = std::unordered_map<std::string, std::vector<std::uint64_t>>;

    // Handle order.
    const std::vector<std::uint64_t>& polylinesOn(zvdb::Database& database,
                                                  const std::string& layer);
    // Whether the index holds this drawing as it stands.
    bool current(const zvdb::Database& database) const {
        return stamp_ == DrawingStamp::of(database);
    }
    // Takes the drawing's polylines by layer, each layer's in handle order, gathered by
    // someone who walked the drawing as it stands anyway.
    void adopt(const zvdb::Database& database, ByLayer byLayer);

private:
    void rebuild(zvdb::Database& database);

    DrawingStamp stamp_;
    ByLayer byLayer_;
};

}  // namespace zvproduct
