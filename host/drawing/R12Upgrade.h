#pragma once
// Turns a drawing read from an R12 file into an R2000 drawing: tables, blocks and entities
// get handles, owners and subclass markers, and the drawing gains block records, layouts
// and the named-objects dictionary. Entity data, extended data and unknown group codes
// are carried over in their order.
#include <cstdint>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class BlockRecord;
class Database;
class DbObject;
class Entity;
struct Tag;

class R12Upgrade {
public:
    static std::unique_ptr<Database> upgrade(const Database& old);

private:
    R12Upgrade(const Database& old, Database& fresh) : old_(old), fresh_(fresh) {}
    void copyHeader();
    void copyTables();
    void copyBlocks();
    void copyEntities();
    Entity* convert(const Entity& entity, std::uint64_t owner, bool paperSpace);
    void place(const Entity& entity, BlockRecord& block);
    void translateHandles();

    const Database& old_;
    Database& fresh_;
    std::unordered_map<std::uint64_t, std::uint64_t> handles_;
    std::vector<DbObject*> converted_;
};

}  // namespace zvdb
