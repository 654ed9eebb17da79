#pragma once
// The symbol blocks of a sample project (terminals, contacts, coils, equipments, pins, bus
// bars, ferrules, sheet frames, layout views) defined in its drawing, and the insertion of a
// symbol with its attributes.
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>
#include "drawing/Geometry.h"

namespace zvdb {
class BlockRecord;
class BlockReference;
class Database;
}  // namespace zvdb

namespace zvsample {

// One attribute of an inserted symbol: tag, value and place relative to the insertion point.
struct SymbolAttribute {
    std::string tag;
    std::string value;
    zvdb::Point3 offset;
};

class SymbolLibrary {
public:
    // Terminal blocks: insertion point at the top, cut point this far below.
    static constexpr double kTerminalLength = 10.0;
    // Coils and lamps: connection points this far above and below the insertion point.
    static constexpr double kCoilReach = 10.0;
    // Contacts: cut point this far below the insertion point.
    static constexpr double kContactLength = 10.0;

    explicit SymbolLibrary(zvdb::Database& database);

    // The block of this name, defined on first use with a plain shape.
    zvdb::BlockRecord& block(std::string_view name);
    zvdb::BlockReference* insert(std::string_view name, const zvdb::Point3& position,
                                 std::string_view layer,
                                 const std::vector<SymbolAttribute>& attributes = {});

private:
    void define(zvdb::BlockRecord& block, std::string_view name);
    void defineTerminal(zvdb::BlockRecord& block);
    void defineContact(zvdb::BlockRecord& block, bool closed);
    void defineBox(zvdb::BlockRecord& block, double halfWidth, double halfHeight);
    void defineFrame(zvdb::BlockRecord& block);
    void defineTitleBlock(zvdb::BlockRecord& block);

    zvdb::Database& db_;
    std::unordered_map<std::string, zvdb::BlockRecord*> blocks_;
};

}  // namespace zvsample
