#pragma once
// A LAYER table record: name, colour, linetype and the frozen, off and locked states.
#include "DbObject.h"

namespace zvdb {

class LayerRecord : public DbObject {
public:
    LayerRecord(Database& database, std::span<const Tag> tags) : DbObject(database, tags) {
        logEditsAsLayer();
    }

    std::string_view name() const { return text(2); }
    bool isFrozen() const { return (integer(70) & 1) != 0; }
    void setFrozen(bool frozen) { setFlag(1, frozen); }
    bool isLocked() const { return (integer(70) & 4) != 0; }
    void setLocked(bool locked) { setFlag(4, locked); }
    // A layer is off when its colour is negative.
    bool isOff() const { return integer(62, 7) < 0; }
    void setOff(bool off);
    int color() const;
    void setColor(int color);
    std::string_view linetype() const { return text(6, "Continuous"); }

private:
    void setFlag(int bit, bool on);
};

}  // namespace zvdb
