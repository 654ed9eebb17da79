#include "Extents.h"

#include "Attribute.h"
#include "BlockRecord.h"
#include "BlockReference.h"
#include "Database.h"
#include "Polyline.h"
#include "TextEntity.h"

#include <cmath>
#include <numbers>
#include <typeinfo>

namespace zvdb {

namespace {

constexpr int kMaxDepth = 16;

BoundingBox transformed(const BoundingBox& box, const Transform& t) {
    BoundingBox result;
    if (box.isEmpty()) return result;
    for (int corner = 0; corner < 8; ++corner) {
        const Point3 p{corner & 1 ? box.max.x : box.min.x, corner & 2 ? box.max.y : box.min.y,
                       corner & 4 ? box.max.z : box.min.z};
        result.add(t.apply(p));
    }
    return result;
}

double radians(double degrees) {
    return degrees * std::numbers::pi / 180.0;
}

}  // namespace

BoundingBox Extents::ofEntity(const Entity& entity, bool withAttributes) {
    return ofEntity(entity, withAttributes, 0);
}

BoundingBox Extents::ofBlock(const BlockRecord& block) {
    return ofBlock(block, 0);
}

// A block inserted many times is measured once until the drawing changes: a page's
// extents ask for the same few symbols over and over.
BoundingBox Extents::ofBlock(const BlockRecord& block, int depth) {
    BoundingBox box;
    if (depth > kMaxDepth) return box;
    const Database& db = block.database();
    if (db.boundsAt_ != db.changeCount()) {
        db.blockBounds_.clear();
        db.boundsAt_ = db.changeCount();
    }
    const Database::BoundsKey key{block.handle(), depth};
    if (block.handle() != 0) {
        const auto known = db.blockBounds_.find(key);
        if (known != db.blockBounds_.end()) return known->second;
    }
    block.forEachEntity([&](Entity& entity) {
        if (!entity.isType("ATTDEF")) box.add(ofEntity(entity, false, depth + 1));
    });
    if (block.handle() != 0 && db.boundsAt_ == db.changeCount()) db.blockBounds_.emplace(key, box);
    return box;
}

BoundingBox Extents::ofText(const Entity& text) {
    BoundingBox box;
    std::size_t length = 0;
    double height = text.real(40, 1.0), width = text.real(41, 1.0), rotation = text.real(50);
    if (const auto* t = dynamic_cast<const TextEntity*>(&text)) {
        length = t->content().size();
        if (t->isMText()) width = 1.0, rotation = 0.0;
    } else if (const auto* a = dynamic_cast<const Attribute*>(&text)) {
        length = a->textValue().size();
    }
    const Transform t = Transform::fromOcs(text.point(210, {0, 0, 1})) *
                        Transform::translation(text.point(10)) *
                        Transform::rotationZ(radians(rotation));
    const double w = height * 0.6 * static_cast<double>(length) * width;
    box.add(t.apply({0, 0, 0}));
    box.add(t.apply({w, height, 0}));
    box.add(t.apply({w, 0, 0}));
    box.add(t.apply({0, height, 0}));
    return box;
}

BoundingBox Extents::ofArc(const Entity& arc) {
    BoundingBox box;
    const Point3 c = arc.point(10);
    const double r = arc.real(40);
    double start = std::fmod(arc.real(50), 360.0), end = std::fmod(arc.real(51), 360.0);
    if (start < 0) start += 360;
    if (end < 0) end += 360;
    if (end <= start) end += 360;
    const Transform ocs = Transform::fromOcs(arc.point(210, {0, 0, 1}));
    auto at = [&](double degrees) {
        box.add(ocs.apply(
            c + Point3{r * std::cos(radians(degrees)), r * std::sin(radians(degrees)), 0}));
    };
    at(start);
    at(end);
    for (double q = 0; q < 720; q += 90)
        if (q > start && q < end) at(q);
    return box;
}

BoundingBox Extents::ofEntity(const Entity& entity, bool withAttributes, int depth) {
    BoundingBox box;
    if (entity.isErased() || depth > kMaxDepth) return box;
    const std::string_view type = entity.type();
    // No kind of reference or polyline derives from their classes: the type tells them, more
    // cheaply than a cast that searches the hierarchy.
    const std::type_info& kind = typeid(entity);
    if (kind == typeid(BlockReference)) {
        const auto* reference = static_cast<const BlockReference*>(&entity);
        if (const BlockRecord* block = reference->definition())
            box = transformed(ofBlock(*block, depth + 1), reference->transformFor(block));
        if (withAttributes)
            for (const Attribute* attribute : reference->attributes())
                if (!attribute->isInvisible()) box.add(ofText(*attribute));
        return box;
    }
    // The object coordinate system, read only for the kinds drawn in it (a reference's is in
    // its transform, a text's in its own placing).
    auto ocs = [&entity] { return Transform::fromOcs(entity.point(210, {0, 0, 1})); };
    if (kind == typeid(Polyline)) {
        const auto* polyline = static_cast<const Polyline*>(&entity);
        const std::vector<Point3> vertices = polyline->vertices();
        if (vertices.empty()) return box;
        if (!polyline->isLightweight()) {
            for (const Point3& p : vertices)
                box.add(p);
            return box;
        }
        const Transform t = ocs();
        for (const Point3& p : vertices)
            box.add(t.apply(p));
    } else if (type == "LINE") {
        box.add(entity.point(10));
        box.add(entity.point(11));
    } else if (type == "CIRCLE") {
        const Point3 c = ocs().apply(entity.point(10));
        const double r = entity.real(40);
        box.add(c - Point3{r, r, 0});
        box.add(c + Point3{r, r, 0});
    } else if (type == "ARC") {
        box = ofArc(entity);
    } else if (type == "ELLIPSE") {
        const Point3 c = entity.point(10);
        const double a = length(entity.point(11));
        box.add(c - Point3{a, a, 0});
        box.add(c + Point3{a, a, 0});
    } else if (type == "POINT") {
        box.add(entity.point(10));
    } else if (type == "SOLID" || type == "TRACE" || type == "3DFACE") {
        const bool face = type == "3DFACE";
        const Transform t = face ? Transform() : ocs();
        for (int code : {10, 11, 12, 13})
            if (entity.has(code)) box.add(face ? entity.point(code) : t.apply(entity.point(code)));
    } else if (type == "TEXT" || type == "MTEXT" || type == "ATTDEF" || type == "ATTRIB") {
        box = ofText(entity);
    }
    return box;
}

}  // namespace zvdb
