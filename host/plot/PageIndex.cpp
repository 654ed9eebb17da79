#include "PageIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagValues.h"

#include <algorithm>
#include <functional>

namespace zvplot {

PageIndex::PageIndex(const zvdb::Database& database)
    : database_(&database), handleSeed_(database.handleSeed()), contentId_(database.contentId()) {
    const zvdb::BlockRecord* model = database.modelSpace();
    if (!model) return;
    std::size_t order = 0;
    for (zvdb::Entity* entity : model->entities()) {
        byLayer_[std::string(entity->layer())].placed.push_back({order++, entity});
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
        for (const Placed& placed : it->second.placed)
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
    return entitiesOn(showingLayers());
}

zvdb::BoundingBox PageIndex::visibleBounds() const {
    return boundsOf(showingLayers());
}

zvdb::BoundingBox PageIndex::boundsOf(const std::vector<std::string>& layers) const {
    std::string key;
    for (const std::string& name : layers)
        key.append(name).push_back('\0');
    if (boundsAt_ != database_->shapeCount()) {
        bounds_.clear();
        boundsAt_ = database_->shapeCount();
    }
    if (auto it = bounds_.find(key); it != bounds_.end()) return it->second;
    zvdb::BoundingBox box;
    for (const zvdb::Entity* entity : entitiesOn(layers))
        box.add(zvdb::Extents::ofEntity(*entity, true));
    // A run shows its pages one by one; a few hundred sets cover any of them.
    constexpr std::size_t kKeptSets = 512;
    if (bounds_.size() >= kKeptSets) bounds_.clear();
    bounds_.emplace(std::move(key), box);
    return box;
}

std::vector<std::string> PageIndex::showingLayers() const {
    followLayerStates();
    std::vector<std::string> layers;
    layers.reserve(showing_.size());
    for (const std::string* name : showing_)
        layers.push_back(*name);
    return layers;
}

std::vector<std::string> PageIndex::layersExcept(
    const std::unordered_set<std::string>& hidden) const {
    std::vector<const std::string*> names;
    for (const auto& [name, layer] : byLayer_)
        if (!hidden.contains(zvdb::TagValues::upperName(name))) names.push_back(&name);
    // The order of showingLayers: that of the names' places, which stay where they are.
    std::sort(names.begin(), names.end(), std::less<>());
    std::vector<std::string> layers;
    layers.reserve(names.size());
    for (const std::string* name : names)
        layers.push_back(*name);
    return layers;
}

zvdb::BoundingBox PageIndex::boundsExcept(const zvdb::Database& database,
                                          const std::unordered_set<std::string>& hidden) {
    zvdb::BoundingBox box;
    const zvdb::BlockRecord* model = database.modelSpace();
    if (!model) return box;
    // Model space runs page by page: the last layer's answer serves the entities after it.
    std::string last;
    bool lastShows = false, known = false;
    for (const zvdb::Entity* entity : model->entities()) {
        if (entity->isErased()) continue;
        const std::string_view layer = entity->layer();
        if (!known || layer != last) {
            last.assign(layer);
            lastShows = !hidden.contains(zvdb::TagValues::upperName(layer));
            known = true;
        }
        if (lastShows) box.add(zvdb::Extents::ofEntity(*entity, true));
    }
    return box;
}

void PageIndex::setShows(std::unordered_map<std::string, Layer>::iterator layer, bool shows) const {
    if (layer->second.shows == shows) return;
    layer->second.shows = shows;
    const std::string* name = &layer->first;
    auto at = std::lower_bound(showing_.begin(), showing_.end(), name, std::less<>());
    if (shows)
        showing_.insert(at, name);
    else
        showing_.erase(at);
}

bool PageIndex::layerShows(const std::string& name) const {
    const zvdb::LayerRecord* layer = database_->layer(name);
    return !layer || (!layer->isFrozen() && !layer->isOff());
}

void PageIndex::followLayerStates() const {
    const zvdb::SymbolTable* table = database_->table("LAYER");
    const std::uint64_t tableIndex = table ? table->indexChanges() : 0;
    const std::vector<const zvdb::DbObject*>& edits = database_->layerEdits();
    if (!statesKnown_ || statesEpoch_ != database_->layerEditsEpoch() ||
        tableIndexAt_ != tableIndex || editsSeen_ > edits.size())
        return readLayerStates();
    for (; editsSeen_ < edits.size(); ++editsSeen_) {
        const auto* record = static_cast<const zvdb::LayerRecord*>(edits[editsSeen_]);
        auto known = recordNames_.find(record);
        // A record not seen before may change what any name finds; a renamed one does once
        // the table is indexed again, which reads the whole table.
        if (known == recordNames_.end()) return readLayerStates();
        if (auto it = byLayer_.find(known->second); it != byLayer_.end())
            setShows(it, layerShows(known->second));
    }
}

void PageIndex::readLayerStates() const {
    recordNames_.clear();
    for (const zvdb::LayerRecord* record : database_->layers())
        recordNames_.emplace(record, std::string(record->name()));
    showing_.clear();
    for (auto& [name, layer] : byLayer_) {
        layer.shows = layerShows(name);
        if (layer.shows) showing_.push_back(&name);
    }
    std::sort(showing_.begin(), showing_.end(), std::less<>());
    const zvdb::SymbolTable* table = database_->table("LAYER");
    tableIndexAt_ = table ? table->indexChanges() : 0;
    statesEpoch_ = database_->layerEditsEpoch();
    editsSeen_ = database_->layerEdits().size();
    statesKnown_ = true;
}

}  // namespace zvplot
