#pragma once
// Builds a Database from the bytes of a DXF file (ASCII or binary, R12 to 2018). A file that
// can't be read throws DxfError naming the line; nothing half-loaded is handed out.
// Repairs of what real files do (missing handles, a missing SEQEND, an unregistered
// extended-data application, a code page that does not match the text) are listed in
// Database::warnings().
#include "Database.h"
#include "DbObject.h"

#include <memory>
#include <span>
#include <string>
#include <vector>

namespace zvdb {

class BlockRecord;
class Entity;

class DxfLoader {
public:
    enum class Context { Table, Entity, Object };

    static std::unique_ptr<Database> load(std::string bytes);
    static std::unique_ptr<Database> loadFile(const std::string& path);
    // The typed object for a type name in its section.
    static std::unique_ptr<DbObject> makeObject(Database& database, std::span<const Tag> tags,
                                                Context context);
    static std::unique_ptr<DbObject> makeOwnedObject(Database& database, std::vector<Tag> tags,
                                                     Context context);

private:
    friend class Database;
    explicit DxfLoader(Database& database) : db_(database) {}
    static void loadInto(Database& database, std::string bytes);

    void run(std::string bytes);
    std::string where(std::size_t tagIndex) const;
    std::string where(const DbObject& object) const;
    void fixEncoding();
    void readSections();
    std::size_t sectionEnd(std::size_t begin, std::string_view name) const;
    void readHeader(std::size_t begin, std::size_t end);
    void readTables(std::size_t begin, std::size_t end);
    void readBlocks(std::size_t begin, std::size_t end);
    void readEntities(std::size_t begin, std::size_t end);
    void readObjects(std::size_t begin, std::size_t end);
    std::size_t nextObject(std::size_t from, std::size_t end) const;
    DbObject* adopt(std::size_t begin, std::size_t end, Context context);
    BlockRecord* blockFor(Entity& blockBegin);
    // A block the file names without defining it; `withEnds` adds its BLOCK and ENDBLK.
    BlockRecord* syntheticBlock(std::string_view name, bool withEnds = true);
    void placeEntity(Entity* entity, BlockRecord* block);
    void closeOpenParent();
    void finish();
    void renumberDuplicates();
    void completeSectionOrder();
    // Files from R13 on give every object a handle and every table record an owner.
    bool modern() const { return db_.version() >= "AC1012"; }

    Database& db_;
    bool binary_ = false;
    std::string_view text_;
    Entity* openParent_ = nullptr;
    BlockRecord* openParentBlock_ = nullptr;
    std::vector<DbObject*> withoutHandle_;
    // Objects whose handle an earlier object holds: they get new handles at the end.
    struct Duplicate {
        DbObject* object;
        std::uint64_t handle;
    };
    std::vector<Duplicate> duplicates_;
    std::vector<std::size_t> comments_;  // tag index after each comment left out
    std::size_t repairedSeqends_ = 0;
};

}  // namespace zvdb
