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
    // Handle order.
    const std::vector<std::uint64_t>& polylinesOn(zvdb::Database& database,
                                                  const std::string& layer);

private:
    void rebuild(zvdb::Database& database);

    DrawingStamp stamp_;
    std::unordered_map<std::string, std::vector<std::uint64_t>> byLayer_;
};

}  // namespace zvproduct
