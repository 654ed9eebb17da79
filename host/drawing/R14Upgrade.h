#pragma once
// Turns a drawing read from an R13 or R14 file (AC1012, AC1014) into an R2000 drawing in
// place. Those files already give every object its handle, owner and subclass markers, so
// every object stays as it was read, with its handle (extended data and dimension styles
// point at blocks by handle); the drawing gains what R2000 adds: the spaces' names in
// R2000 case, the named-objects dictionary and the layouts of model and paper space.
#include <cstdint>
#include <string_view>

namespace zvdb {

class BlockRecord;
class Database;
class Dictionary;

class R14Upgrade {
public:
    static void upgrade(Database& database);

private:
    explicit R14Upgrade(Database& database) : db_(database) {}
    void renameSpace(BlockRecord& space, std::string_view name);
    void addLayouts();
    void declareLayoutClass();

    Database& db_;
};

}  // namespace zvdb
