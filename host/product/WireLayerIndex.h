#pragma once
// The wire and lead polylines of each layer, gathered in one pass and kept while the drawing
// is unchanged: the readers ask for every page in turn, and each answer is then a look-up.
#include "ConnectionFinder.h"
#include "DrawingStamp.h"

#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <unordered_map>
#include <vector>

namespace zvproduct {

class WireLayerIndex {
public:
    using ByLayer = std::unordered_map<std::string, std::vector<std::uint64_t>>;
    using VerticesByLayer = std::unordered_map<std::string, LayerVertices>;

    // Handle order.
    const std::vector<std::uint64_t>& polylinesOn(zvdb::Database& database,
                                                  const std::string& layer);
    // Whether the index holds this drawing as it stands.
    bool current(const zvdb::Database& database) const {
        return stamp_ == DrawingStamp::of(database);
    }
    // Takes the drawing's polylines by layer, each layer's in handle order, gathered by
    // someone who walked the drawing as it stands anyway.
    // With `vertices`, the vertices of each as well, from the same walk.
    void adopt(const zvdb::Database& database, ByLayer byLayer, VerticesByLayer vertices = {});
    // The polylinesOn(layer), each with its vertices as Polyline::vertices gives them: those
    // handed over with the index the first time, else read now.
    using Visit = std::function<void(std::uint64_t handle, std::span<const zvdb::Point3>)>;
    void eachOn(zvdb::Database& database, const std::string& layer, const Visit& visit);

    // Whether vertices handed over are held.
    bool holdsVertices() const { return !vertices_.empty(); }
    // Lets go of the vertices handed over once the drawing changed: nobody asks for them.
    void releaseStaleVertices(const zvdb::Database& database) {
        if (!vertices_.empty() && !current(database)) vertices_.clear();
    }

private:
    void rebuild(zvdb::Database& database);

    DrawingStamp stamp_;
    ByLayer byLayer_;
    VerticesByLayer vertices_;
};

}  // namespace zvproduct
