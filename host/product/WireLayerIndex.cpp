#include "WireLayerIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
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
    database_ = &database;
    handleSeed_ = database.handleSeed();
    objectCount_ = database.objectCount();
}

std::vector<std::uint64_t> WireLayerIndex::polylinesOn(zvdb::Database& database,
                                                       const std::string& layer) {
    if (database_ != &database || handleSeed_ != database.handleSeed() ||
        objectCount_ != database.objectCount())
        rebuild(database);
    std::vector<std::uint64_t> handles;
    auto found = byLayer_.find(layer);
    if (found == byLayer_.end()) return handles;
    for (std::uint64_t handle : found->second) {
        zvdb::Entity* entity = database.entityByHandle(handle);
        if (entity && !entity->isErased() && entity->layer() == layer) handles.push_back(handle);
    }
    return handles;
}

}  // namespace zvproduct
