#include "BlockReference.h"

#include "Attribute.h"
#include "BlockRecord.h"
#include "Database.h"
#include "TagList.h"
#include "TagValues.h"

#include <cmath>
#include <numbers>

namespace zvdb {

BlockRecord* BlockReference::definition() const {
    return database().block(blockName());
}

void BlockReference::setScale(const Point3& scale) {
    setReal(41, scale.x, "AcDbBlockReference");
    setReal(42, scale.y, "AcDbBlockReference");
    setReal(43, scale.z, "AcDbBlockReference");
}

namespace {

// What position(), scale(), rotation() and extrusion() answer, found in one walk of the tags
// by the same rules (outside application groups, before the extended data).
struct Placing {
    Point3 position, scale{1, 1, 1}, extrusion{0, 0, 1};
    double rotation = 0.0;
};

Placing readPlacing(std::span<const Tag> all) {
    const std::size_t end = TagList::xdataStart(all);
    std::size_t at[6] = {0, 0, 0, 0, 0, 0};  // 10, 41, 42, 43, 50, 210; 0 when absent
    bool inGroup = false;
    for (std::size_t i = 1; i < end; ++i) {
        const Tag& tag = all[i];
        if (TagList::opensGroup(tag)) {
            inGroup = true;
        } else if (TagList::closesGroup(tag)) {
            inGroup = false;
        } else if (!inGroup) {
            const int slot = tag.code == 10    ? 0
                             : tag.code == 41  ? 1
                             : tag.code == 42  ? 2
                             : tag.code == 43  ? 3
                             : tag.code == 50  ? 4
                             : tag.code == 210 ? 5
                                               : -1;
            if (slot >= 0 && at[slot] == 0) at[slot] = i;
        }
    }
    const auto point = [&](std::size_t i, int code, const Point3& fallback) {
        if (i == 0) return fallback;
        Point3 p{TagValues::toReal(all[i].value), 0.0, 0.0};
        std::size_t k = i + 1;
        if (k < all.size() && all[k].code == code + 10) p.y = TagValues::toReal(all[k++].value);
        if (k < all.size() && all[k].code == code + 20) p.z = TagValues::toReal(all[k].value);
        return p;
    };
    const auto real = [&](std::size_t i, double fallback) {
        return i == 0 ? fallback : TagValues::toReal(all[i].value, fallback);
    };
    Placing placing;
    placing.position = point(at[0], 10, Point3{});
    placing.scale = {real(at[1], 1.0), real(at[2], 1.0), real(at[3], 1.0)};
    placing.rotation = real(at[4], 0.0);
    placing.extrusion = point(at[5], 210, Point3{0, 0, 1});
    return placing;
}

}  // namespace

namespace {

bool finite(const Point3& p) {
    return std::isfinite(p.x) && std::isfinite(p.y) && std::isfinite(p.z);
}

// The product below for a reference along the Z axis, without the products by identities:
// each of those gives the other factor plus zero (a negative zero comes out positive), so
// these sums give the same bits for finite values.
Transform alongZ(const Point3& base, const Point3& position, const Point3& scale, double radians) {
    const double c = radians == 0.0 ? 1.0 : std::cos(radians);
    const double s = radians == 0.0 ? radians : std::sin(radians);
    const double rotation[9] = {c, -s, 0, s, c, 0, 0, 0, 1};
    const double scales[3] = {scale.x, scale.y, scale.z};
    Transform t;
    for (int i = 0; i < 9; ++i)
        t.linear[i] = ((rotation[i] + 0.0) * scales[i % 3]) + 0.0;
    t.move = Point3{position.x + 0.0, position.y + 0.0, position.z + 0.0};
    t.move = t.apply(base * -1.0);
    return t;
}

}  // namespace

Transform BlockReference::transformOf(const Point3& base, const Point3& position,
                                      const Point3& scale, double rotationDegrees,
                                      const Point3& extrusion) {
    const double radians = rotationDegrees * std::numbers::pi / 180.0;
    if (extrusion == Point3{0, 0, 1} && finite(position)) {
        // Unturned and unscaled, the product's linear part is the identity, and its move is
        // this one whatever the base point.
        if (radians == 0.0 && scale == Point3{1, 1, 1}) {
            Transform t;
            t.move = Point3{position.x + 0.0, position.y + 0.0, position.z + 0.0};
            t.move = t.apply(base * -1.0);
            return t;
        }
    }
    if (extrusion == Point3{0, 0, 1} && finite(base) && finite(position) && finite(scale) &&
        std::isfinite(radians)) {
        // The move is worked out as the product works it out; the linear part only differs
        // where an entry is out of range (the product multiplies it by zero).
        const Transform t = alongZ(base, position, scale, radians);
        bool inRange = true;
        for (const double entry : t.linear)
            inRange = inRange && std::isfinite(entry);
        if (inRange) return t;
    }
    return Transform::fromOcs(extrusion) * Transform::translation(position) *
           Transform::rotationZ(radians) * Transform::scaling(scale.x, scale.y, scale.z) *
           Transform::translation(base * -1.0);
}

Transform BlockReference::transform() const {
    return transformFor(definition());
}

Transform BlockReference::transformFor(const BlockRecord* block) const {
    const Point3 base = block ? block->basePoint() : Point3{};
    const Placing p = readPlacing(tags());
    return transformOf(base, p.position, p.scale, p.rotation, p.extrusion);
}

std::vector<Attribute*> BlockReference::attributes() const {
    std::vector<Attribute*> result;
    for (Entity* sub : subEntities())
        if (!sub->isErased())
            if (auto* attribute = dynamic_cast<Attribute*>(sub)) result.push_back(attribute);
    return result;
}

Attribute* BlockReference::attribute(std::string_view tag) const {
    for (Entity* sub : subEntities()) {
        auto* attribute = dynamic_cast<Attribute*>(sub);
        if (attribute && !attribute->isErased() && TagValues::sameName(attribute->tag(), tag))
            return attribute;
    }
    return nullptr;
}

Attribute* BlockReference::addAttribute(std::string_view tag, std::string_view value,
                                        const Point3& position, double height) {
    TagListBuilder body(database().arena());
    body.point(10, position).real(40, height).text(1, value);
    body.text(100, "AcDbAttribute").text(2, tag).integer(70, 0);
    return database().addAttribute(*this, body.take(), layer());
}

Attribute* BlockReference::addAttributeFromDefinition(const Attribute& definition) {
    const Attribute* const one[1] = {&definition};
    return addAttributesFromDefinitions(one).front();
}

std::vector<Attribute*> BlockReference::addAttributesFromDefinitions(
    std::span<const Attribute* const> definitions,
    std::span<const std::optional<std::string_view>> values) {
    if (definitions.empty()) return {};
    const Placing p = readPlacing(tags());
    return database().addAttributesFromDefinitions(*this, definitions, values, transform(),
                                                   std::abs(p.scale.y), p.rotation);
}

std::vector<Attribute*> BlockReference::addAttributesFromDefinitions(
    const BlockRecord& block, const Point3& position, const Point3& scale, double rotationDegrees,
    std::span<const Attribute* const> definitions,
    std::span<const std::optional<std::string_view>> values) {
    if (definitions.empty()) return {};
    // What reading the tags back gives: a rotation left unwritten (-0 too) reads as 0, and
    // written reals read back exactly.
    const double rotation = rotationDegrees != 0.0 ? rotationDegrees : 0.0;
    return database().addAttributesFromDefinitions(
        *this, definitions, values, transformOf(block.basePoint(), position, scale, rotation),
        std::abs(scale.y), rotation);
}

std::vector<Attribute*> BlockReference::addAttributesFromLayouts(
    const Point3& basePoint, const Point3& position, const Point3& scale, double rotationDegrees,
    std::span<AttributeLayout* const> layouts,
    std::span<const std::optional<std::string_view>> values) {
    std::vector<Attribute*> made;
    if (layouts.empty()) return made;
    const double rotation = rotationDegrees != 0.0 ? rotationDegrees : 0.0;
    database().addAttributesFromLayouts(*this, layouts, values,
                                        transformOf(basePoint, position, scale, rotation),
                                        std::abs(scale.y), rotation, &made);
    return made;
}

void BlockReference::placeAttributesFromLayouts(
    const Point3& basePoint, const Point3& position, const Point3& scale, double rotationDegrees,
    std::span<AttributeLayout* const> layouts,
    std::span<const std::optional<std::string_view>> values) {
    if (layouts.empty()) return;
    const double rotation = rotationDegrees != 0.0 ? rotationDegrees : 0.0;
    database().addAttributesFromLayouts(*this, layouts, values,
                                        transformOf(basePoint, position, scale, rotation),
                                        std::abs(scale.y), rotation, nullptr);
}

}  // namespace zvdb
