#pragma once
// A graphical entity of a block (model space, paper space or a block definition). Entities
// that carry others (an INSERT its ATTRIBs, a POLYLINE its VERTEXes) hold them in order,
// with the closing SEQEND.
#include "DbObject.h"

#include <cstdint>
#include <span>
#include <vector>

namespace zvdb {

class BlockRecord;

class Entity : public DbObject {
public:
    using DbObject::DbObject;
    ~Entity() override;

    std::string_view layer() const { return text(8, "0"); }
    void setLayer(std::string_view layer) { setText(8, layer, "AcDbEntity"); }
    // ACI colour; 256 is "by layer", 0 "by block".
    int color() const { return static_cast<int>(integer(62, 256)); }
    void setColor(int color) { setInteger(62, color, "AcDbEntity"); }
    std::string_view linetype() const { return text(6, "BYLAYER"); }
    void setLinetype(std::string_view linetype) { setText(6, linetype, "AcDbEntity"); }
    bool inPaperSpace() const { return flag(67); }
    // The block record that holds the entity (for a sub-entity, its parent's).
    BlockRecord* block() const;
    // The INSERT of an ATTRIB, the POLYLINE of a VERTEX or SEQEND; else null.
    Entity* parent() const { return subEntity_ ? link_.parent : nullptr; }
    // ATTRIBs or VERTEXes, erased ones included; see liveSubEntities().
    std::span<Entity* const> subEntities() const;
    std::vector<Entity*> liveSubEntities() const;
    Entity* seqend() const {
        return !subEntity_ && link_.children ? link_.children->seqend : nullptr;
    }
    void erase() override;
    // Moves the entity (and its attributes or vertices) by a world offset; false for kinds
    // whose geometry is not known here (they stay where they are).
    bool moveBy(const Point3& offset);

protected:
    friend class Database;
    friend class DxfLoader;
    friend class BlockRecord;
    friend class DeepCloner;
    friend class R12Upgrade;
    void addSubEntity(Entity* sub);
    void setSeqend(Entity* seqend);
    // Room for `more` sub-entities after those there are, at that size.
    void reserveSubEntities(std::size_t more);

private:
    // Held apart: most entities have none, and they are the most numerous objects. The
    // sub-entities follow in the same room (a reference has a few), taken from the pool.
    struct Children {
        Entity* seqend = nullptr;
        std::uint32_t size = 0;
        std::uint32_t capacity = 0;
        Entity** subs() { return reinterpret_cast<Entity**>(this + 1); }
        static Children* make(std::uint32_t capacity);
        static void drop(Children* children) noexcept;
    };
    Children& children();
    // Moves the children to a room for `capacity` sub-entities.
    void growChildren(std::size_t capacity);
    // The entity under this one becomes its child.
    void adoptChild(Entity& sub);
    // A sub-entity has a parent and no children, any other entity may have children and has
    // no parent: one pointer holds either, as subEntity_ tells.
    union Link {
        Children* children = nullptr;
        Entity* parent;
    } link_;
};

}  // namespace zvdb
