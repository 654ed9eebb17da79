#include "PageIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"

#include <algorithm>

namespace zvplot {

PageIndex::PageIndex(const zvdb::Database& database)
    : database_(&database), handleSeed_(database.handleSeed()), contentId_(database.contentId()) {
    const zvdb::BlockRecord* model = database.modelSpace();
    if (!model) return;
    std::size_t order = 0;
    for (zvdb::Entity* entity : model->entities()) {
        byLayer_[std::string(entity->layer())].push_back({order++, entity});
    }
    entityCount_ = order;
}

bool PageIndex::matches(const zvdb::Database& database) const {
    // New entities take new handles; erased ones are left out when the index is read.
    return database_ == &database && handleSeed_ == database.handleSeed() &&
           contentId_ == database.contentId();
}

std::vector<std::string> PageIndex::pageLayers(const zvdb::Database& database,
                                               std::string_view page) {
    std::vector<std::string> layers{std::string(page)};
    // The base name is the first non-empty piece before a "$".
    std::string_view rest = page;
    std::string base;
    while (!rest.empty() && base.empty()) {
        const std::size_t cut = rest.find('$');
        base = std::string(rest.substr(0, cut));
        rest = cut == std::string_view::npos ? std::string_view() : rest.substr(cut + 1);
    }
    if (base.empty()) return layers;
    const zvdb::LayerRecord* record = database.layer(page);
    const bool cover =
        record && (record->hasXData("KVR_ZV_CAPA") || record->hasXData("KVR_ZV_INDICE"));
    for (const char* companion : {"$DE", "$FORMATO", "$SELO"}) {
        if (cover && std::string_view(companion) == "$SELO") continue;
        const std::string name = base + companion;
        if (name != page) layers.push_back(name);
    }
    return layers;
}

std::vector<zvdb::Entity*> PageIndex::entitiesOn(const std::vector<std::string>& layers) const {
    std::vector<Placed> found;
    for (const std::string& layer : layers) {
        auto it = byLayer_.find(layer);
        if (it == byLayer_.end()) continue;
        for (const Placed& placed : it->second)
            // An entity moved to another layer since the index was made is left out.
            if (!placed.entity->isErased() && placed.entity->layer() == layer)
                found.push_back(placed);
    }
    std::sort(found.begin(), found.end(),
              [](const Placed& a, const Placed& b) { return a.order < b.order; });
    std::vector<zvdb::Entity*> out;
    out.reserve(found.size());
    for (const Placed& placed : found)
        out.push_back(placed.entity);
    return out;
}

std::vector<zvdb::Entity*> PageIndex::visibleEntities() const {
    std::vector<std::string> layers;
    for (const auto& [name, entities] : byLayer_) {
        const zvdb::LayerRecord* layer = database_->layer(name);
        if (!layer || (!layer->isFrozen() && !layer->isOff())) layers.push_back(name);
    }
    return entitiesOn(layers);
}

}  // namespace zvplot
