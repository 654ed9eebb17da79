#pragma once
// Which drawing, at which change: what the product's functions work out from a drawing once
// and keep is good while the stamp stays the same.
#include "drawing/Database.h"

#include <cstdint>

namespace zvproduct {

struct DrawingStamp {
    const zvdb::Database* database = nullptr;
    std::uint64_t changes = 0;

    static DrawingStamp of(const zvdb::Database& database) {
        return {&database, database.changeCount()};
    }
    // The same, blind to the edits of layer records (their states, colours, names): for what
    // is worked out from other objects alone, kept over the freezes and thaws of page swaps.
    static DrawingStamp ofShapes(const zvdb::Database& database) {
        return {&database, database.shapeCount()};
    }
    bool operator==(const DrawingStamp&) const = default;
};

}  // namespace zvproduct
