#pragma once
// Model space by layer, made in one pass, so that a page's entities (or those of the layers
// that are showing) are found without walking the whole drawing for every page.
#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {
class Database;
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
    // Still a true picture of this drawing: nothing was added since (what was erased is left
    // out as the index is read).
    bool matches(const zvdb::Database& database) const;

private:
    struct Placed {
        std::size_t order;
        zvdb::Entity* entity;
    };
    const zvdb::Database* database_;
    std::uint64_t handleSeed_ = 0;
    std::uint64_t contentId_ = 0;
    std::size_t entityCount_ = 0;
    std::unordered_map<std::string, std::vector<Placed>> byLayer_;
};

}  // namespace zvplot
