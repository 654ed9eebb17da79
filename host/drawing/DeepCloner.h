#pragma once
// Copies entities and block definitions from one database into another, with new handles:
// references between copied objects are translated, the layers, linetypes, text styles and
// nested blocks that the copies use are brought along when the target lacks them, and
// extension dictionaries are copied with their contents.
#include "Geometry.h"

#include <cstdint>
#include <span>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class BlockRecord;
class Database;
class DbObject;
class Entity;

class DeepCloner {
public:
    DeepCloner(const Database& source, Database& target) : source_(source), target_(target) {}

    // Copies the entities, in order, to the end of `into`; answers the copies.
    std::vector<Entity*> cloneEntities(std::span<Entity* const> entities, BlockRecord& into);
    // The target's block of the name, copied from `block` when the target has none.
    BlockRecord* cloneBlock(const BlockRecord& block);
    // The source's model space as a new block of the target (replacing nothing: an existing
    // block of that name is answered as it is).
    BlockRecord* cloneModelSpaceAsBlock(std::string_view name);
    // The copy of a source handle; 0 when it was not copied.
    std::uint64_t translated(std::uint64_t sourceHandle) const;

private:
    Entity* cloneEntity(const Entity& entity, std::uint64_t owner, BlockRecord* block);
    DbObject* cloneOwned(const DbObject& object, std::uint64_t owner);
    std::vector<struct Tag> copiedTags(const DbObject& object, std::uint64_t owner,
                                       std::uint64_t& newHandle);
    void bringSymbols(const Entity& entity);
    void bringRecord(std::string_view table, std::string_view name);
    void translateReferences();

    const Database& source_;
    Database& target_;
    std::unordered_map<std::uint64_t, std::uint64_t> map_;
    std::vector<DbObject*> clones_;
};

}  // namespace zvdb
