#include "WireLayerIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Entity.h"
#include "drawing/Polyline.h"

#include <algorithm>

namespace zvproduct {

void WireLayerIndex::rebuild(zvdb::Database& database) {
    byLayer_.clear();
    vertices_.clear();
    for (zvdb::Entity* entity : database.modelSpace()->entities()) {
        if (!dynamic_cast<zvdb::Polyline*>(entity)) continue;
        if (entity->hasXData("KVR_ZV_WIRE") || entity->hasXData("KVR_ZV_CABO"))
            byLayer_[std::string(entity->layer())].push_back(entity->handle());
    }
    for (auto& [layer, handles] : byLayer_)
        std::sort(handles.begin(), handles.end());
    stamp_ = DrawingStamp::of(database);
}

void WireLayerIndex::adopt(const zvdb::Database& database, ByLayer byLayer,
                           VerticesByLayer vertices) {
    byLayer_ = std::move(byLayer);
    vertices_ = std::move(vertices);
    stamp_ = DrawingStamp::of(database);
}

const std::vector<std::uint64_t>& WireLayerIndex::polylinesOn(zvdb::Database& database,
                                                              const std::string& layer) {
    static const std::vector<std::uint64_t> none;
    if (!(stamp_ == DrawingStamp::of(database))) rebuild(database);
    auto found = byLayer_.find(layer);
    return found == byLayer_.end() ? none : found->second;
}

void WireLayerIndex::eachOn(zvdb::Database& database, const std::string& layer,
                            const Visit& visit) {
    const std::vector<std::uint64_t>& handles = polylinesOn(database, layer);
    auto kept = vertices_.find(layer);
    if (kept != vertices_.end() && kept->second.starts.size() == handles.size()) {
        for (std::size_t k = 0; k < handles.size(); ++k)
            visit(handles[k], kept->second.of(k));
        // A reader keeps what it read of a layer: the walk's vertices go with the last layer.
        vertices_.erase(kept);
        return;
    }
    for (const std::uint64_t handle : handles) {
        auto* polyline = dynamic_cast<zvdb::Polyline*>(database.objectByHandle(handle));
        const std::vector<zvdb::Point3> points =
            polyline ? polyline->vertices() : std::vector<zvdb::Point3>();
        visit(handle, points);
    }
}

}  // namespace zvproduct
