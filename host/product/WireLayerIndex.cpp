#include "WireLayerIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Entity.h"
#include "drawing/Polyline.h"

#include <algorithm>

namespace zvproduct {

void WireLayerIndex::rebuild(zvdb::Database& database) {
    byLayer_.clear();
    for (zvdb::Entity* entity : database.modelSpace()->entities()) {
        if (!dynamic_cast<zvdb::Polyline*>(entity)) continue;
        if (entity->hasXData("KVR_ZV_WIRE") || entity->hasXData("KVR_ZV_CABO"))
            byLayer_[std::string(entity->layer())].push_back(entity->handle());
    }
    for (auto& [layer, handles] : byLayer_)
        std::sort(handles.begin(), handles.end());
    stamp_ = DrawingStamp::of(database);
}

void WireLayerIndex::adopt(const zvdb::Database& database, ByLayer byLayer) {
    byLayer_ = std::move(byLayer);
    stamp_ = DrawingStamp::of(database);
}

const std::vector<std::uint64_t>& WireLayerIndex::polylinesOn(zvdb::Database& database,
                                                              const std::string& layer) {
    static const std::vector<std::uint64_t> none;
    if (!(stamp_ == DrawingStamp::of(database))) rebuild(database);
    auto found = byLayer_.find(layer);
    return found == byLayer_.end() ? none : found->second;
}

}  // namespace zvproduct
