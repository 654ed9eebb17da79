#include "Entity.h"

#include "BlockRecord.h"
#include "Database.h"
#include "ObjectPool.h"
#include "TagValues.h"

#include <algorithm>
#include <new>

namespace zvdb {

// The most numerous objects of a drawing: a member more must not make each one bigger.
static_assert(sizeof(Entity) <= 56, "Entity grew");

Entity::~Entity() {
    if (!subEntity_) Children::drop(link_.children);
}

BlockRecord* Entity::block() const {
    if (Entity* up = parent()) return up->block();
    return dynamic_cast<BlockRecord*>(database().objectByHandle(ownerHandle()));
}

std::span<Entity* const> Entity::subEntities() const {
    if (subEntity_ || !link_.children) return {};
    return {link_.children->subs(), link_.children->size};
}

Entity::Children* Entity::Children::make(std::uint32_t capacity) {
    void* room = pool::take(sizeof(Children) + capacity * sizeof(Entity*));
    auto* made = new (room) Children();
    made->capacity = capacity;
    return made;
}

void Entity::Children::drop(Children* children) noexcept {
    if (children) pool::give(children, sizeof(Children) + children->capacity * sizeof(Entity*));
}

void Entity::growChildren(std::size_t capacity) {
    Children* old = link_.children;
    Children* grown = Children::make(static_cast<std::uint32_t>(capacity));
    if (old) {
        grown->seqend = old->seqend;
        grown->size = old->size;
        std::copy(old->subs(), old->subs() + old->size, grown->subs());
    }
    link_.children = grown;
    Children::drop(old);
}

void Entity::reserveSubEntities(std::size_t more) {
    const std::size_t size = link_.children ? link_.children->size : 0;
    if (!link_.children || link_.children->capacity < size + more) growChildren(size + more);
}

Entity::Children& Entity::children() {
    // Never a sub-entity's: ATTRIBs, VERTEXes and SEQENDs are the only children, and carry none.
    if (!link_.children) link_.children = Children::make(0);
    return *link_.children;
}

std::vector<Entity*> Entity::liveSubEntities() const {
    const std::span<Entity* const> subs = subEntities();
    std::vector<Entity*> live;
    live.reserve(subs.size());
    for (Entity* sub : subs)
        if (!sub->isErased()) live.push_back(sub);
    return live;
}

void Entity::erase() {
    if (isErased()) return;
    DbObject::erase();
    for (Entity* sub : subEntities())
        sub->erase();
    if (Entity* end = seqend()) end->erase();
}

namespace {

// Point codes that hold positions, by entity type (others hold vectors or nothing).
std::vector<int> positionCodes(std::string_view type) {
    if (type == "LINE" || type == "TEXT" || type == "ATTRIB" || type == "ATTDEF") return {10, 11};
    if (type == "SOLID" || type == "TRACE" || type == "3DFACE") return {10, 11, 12, 13};
    if (type == "CIRCLE" || type == "ARC" || type == "POINT" || type == "INSERT" ||
        type == "MTEXT" || type == "ELLIPSE" || type == "VERTEX")
        return {10};
    return {};
}

bool inObjectCoordinates(std::string_view type) {
    return type == "CIRCLE" || type == "ARC" || type == "TEXT" || type == "ATTRIB" ||
           type == "ATTDEF" || type == "INSERT" || type == "SOLID" || type == "TRACE" ||
           type == "LWPOLYLINE";
}

}  // namespace

bool Entity::moveBy(const Point3& offset) {
    const std::string_view type = this->type();
    Point3 move = offset;
    if (inObjectCoordinates(type)) {
        // The object coordinate system is orthonormal: its inverse is its transpose.
        const Transform ocs = Transform::fromOcs(point(210, {0, 0, 1}));
        const auto& m = ocs.linear;
        move = {m[0] * offset.x + m[3] * offset.y + m[6] * offset.z,
                m[1] * offset.x + m[4] * offset.y + m[7] * offset.z,
                m[2] * offset.x + m[5] * offset.y + m[8] * offset.z};
    }
    if (type == "LWPOLYLINE") {
        auto& all = editTags();
        const std::size_t end = xdataStart();
        for (std::size_t i = 1; i < end; ++i) {
            const double delta = all[i].code == 10 ? move.x : all[i].code == 20 ? move.y : 0.0;
            if (delta != 0.0 && (all[i].code == 10 || all[i].code == 20))
                all[i].value = store(TagValues::fromReal(TagValues::toReal(all[i].value) + delta));
        }
        if (move.z != 0.0) setReal(38, real(38) + move.z, "AcDbPolyline");
        return true;
    }
    if (type == "POLYLINE") {
        for (Entity* vertex : subEntities())
            vertex->moveBy(offset);
        return true;
    }
    const std::vector<int> codes = positionCodes(type);
    if (codes.empty()) return false;
    for (int code : codes)
        if (has(code)) setPoint(code, point(code) + move);
    for (Entity* sub : subEntities())
        sub->moveBy(offset);
    return true;
}

void Entity::adoptChild(Entity& sub) {
    // A new sub-entity has no children of its own: they would have no way back to it.
    if (!sub.subEntity_) Children::drop(sub.link_.children);
    sub.link_.parent = this;
    sub.subEntity_ = true;
}

void Entity::addSubEntity(Entity* sub) {
    adoptChild(*sub);
    Children* own = link_.children;
    if (!own || own->size == own->capacity)
        growChildren(own ? std::max<std::size_t>(2, 2 * std::size_t(own->capacity)) : 1);
    own = link_.children;
    own->subs()[own->size++] = sub;
}

void Entity::setSeqend(Entity* seqend) {
    adoptChild(*seqend);
    children().seqend = seqend;
}

}  // namespace zvdb
