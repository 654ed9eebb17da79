#pragma once
// Model space by layer, made in one pass, so that a page's entities (or those of the layers
// that are showing) are found without walking the whole drawing for every page.
#include "drawing/Geometry.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace zvdb {
class Database;
class DbObject;
class Entity;
}  // namespace zvdb

namespace zvplot {

class PageIndex {
public:
    explicit PageIndex(const zvdb::Database& database);

    // The layers that show a page: the page, its "$DE" and "$FORMATO" companions and, unless
    // the page is a cover or an index, its "$SELO".
    static std::vector<std::string> pageLayers(const zvdb::Database& database,
                                               std::string_view page);
    // The entities on these layers, in drawing order.
    std::vector<zvdb::Entity*> entitiesOn(const std::vector<std::string>& layers) const;
    // The entities on the layers that are neither frozen nor off, in drawing order.
    std::vector<zvdb::Entity*> visibleEntities() const;
    // The bounds of those entities, attributes included. Pages shown in turn show the same
    // layers again: each set of showing layers is measured once while the drawing's
    // entities and blocks stay as they are.
    zvdb::BoundingBox visibleBounds() const;
    // The same for the entities on these layers, given in the order showingLayers gives
    // them (the order keys the measures kept).
    zvdb::BoundingBox boundsOf(const std::vector<std::string>& layers) const;
    // The names of the layers that hold entities and are neither frozen nor off.
    std::vector<std::string> showingLayers() const;
    // The names of the layers that hold entities, but for those whose upper-case names are
    // in `hidden`, in the order showingLayers gives them.
    std::vector<std::string> layersExcept(const std::unordered_set<std::string>& hidden) const;
    // The bounds of the model-space entities on layers whose upper-case names are not in
    // `hidden`, attributes included, from one walk of model space and no index.
    static zvdb::BoundingBox boundsExcept(const zvdb::Database& database,
                                          const std::unordered_set<std::string>& hidden);
    // Still a true picture of this drawing: nothing was added since (what was erased is left
    // out as the index is read).
    bool matches(const zvdb::Database& database) const;

private:
    struct Placed {
        std::size_t order;
        zvdb::Entity* entity;
    };
    struct Layer {
        std::vector<Placed> placed;
        bool shows = false;  // as the layer table said when last read
    };
    // Brings the layers' `shows` up to date: from the drawing's log of layer edits when it
    // can, from the whole table otherwise.
    void followLayerStates() const;
    void readLayerStates() const;
    void setShows(std::unordered_map<std::string, Layer>::iterator layer, bool shows) const;
    bool layerShows(const std::string& name) const;

    const zvdb::Database* database_;
    std::uint64_t handleSeed_ = 0;
    std::uint64_t contentId_ = 0;
    std::size_t entityCount_ = 0;
    mutable std::unordered_map<std::string, Layer> byLayer_;
    // The names of the layers that show (keys of byLayer_, which stay where they are), in
    // the order of their addresses: a handful, where byLayer_ holds every page.
    mutable std::vector<const std::string*> showing_;
    // The layer records and their names when the table was last read whole.
    mutable std::unordered_map<const zvdb::DbObject*, std::string> recordNames_;
    mutable bool statesKnown_ = false;
    mutable std::uint64_t statesEpoch_ = 0;
    mutable std::uint64_t tableIndexAt_ = 0;
    mutable std::size_t editsSeen_ = 0;
    // Bounds by set of showing layers, good while the drawing's shape count is `boundsAt_`.
    mutable std::unordered_map<std::string, zvdb::BoundingBox> bounds_;
    mutable std::uint64_t boundsAt_ = 0;
};

}  // namespace zvplot
