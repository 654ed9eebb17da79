#pragma once
// An INSERT: a reference to a block definition, with its attributes.
#include "Entity.h"

#include <optional>
#include <span>
#include <string_view>

namespace zvdb {

class Attribute;
class AttributeLayout;
class BlockRecord;

class BlockReference : public Entity {
public:
    using Entity::Entity;

    std::string_view blockName() const { return text(2); }
    BlockRecord* definition() const;
    Point3 position() const { return point(10); }
    void setPosition(const Point3& p) { setPoint(10, p, "AcDbBlockReference"); }
    Point3 scale() const { return {real(41, 1.0), real(42, 1.0), real(43, 1.0)}; }
    void setScale(const Point3& scale);
    double rotation() const { return real(50); }  // degrees
    void setRotation(double degrees) { setReal(50, degrees, "AcDbBlockReference"); }
    Point3 extrusion() const { return point(210, Point3{0, 0, 1}); }
    // From the block definition's coordinates to the coordinates of the reference's owner.
    Transform transform() const;
    // The same with the definition already found (null: none), for a caller that needs both.
    Transform transformFor(const BlockRecord* block) const;
    // The same for a reference placed by these values, `base` being its block's base point.
    static Transform transformOf(const Point3& base, const Point3& position, const Point3& scale,
                                 double rotationDegrees, const Point3& extrusion = {0, 0, 1});

    // Attributes in order, erased ones left out.
    std::vector<Attribute*> attributes() const;
    // The first attribute with the tag, ignoring case; null when none.
    Attribute* attribute(std::string_view tag) const;
    Attribute* addAttribute(std::string_view tag, std::string_view value, const Point3& position,
                            double height);
    // A new attribute made from a definition of the block: its properties, placed by the
    // reference's transform, with the definition's default value.
    Attribute* addAttributeFromDefinition(const Attribute& definition);
    // The same for several definitions at once (the placement is worked out once), in order.
    // `values`, when not empty, holds for each definition the text value to give instead of
    // its default (none: the default).
    std::vector<Attribute*> addAttributesFromDefinitions(
        std::span<const Attribute* const> definitions,
        std::span<const std::optional<std::string_view>> values = {});
    // The same for a reference just made by BlockRecord::addBlockReference with `block` and
    // these values: the placement is worked out from them instead of read back from the
    // tags, and the block is not looked up by name.
    std::vector<Attribute*> addAttributesFromDefinitions(
        const BlockRecord& block, const Point3& position, const Point3& scale,
        double rotationDegrees, std::span<const Attribute* const> definitions,
        std::span<const std::optional<std::string_view>> values);
    // The same from the layouts of the block's definitions (AttributeLayouts::variableLayouts),
    // `basePoint` being the block's.
    std::vector<Attribute*> addAttributesFromLayouts(
        const Point3& basePoint, const Point3& position, const Point3& scale,
        double rotationDegrees, std::span<AttributeLayout* const> layouts,
        std::span<const std::optional<std::string_view>> values);
    // The same for a caller that does not keep the attributes made.
    void placeAttributesFromLayouts(const Point3& basePoint, const Point3& position,
                                    const Point3& scale, double rotationDegrees,
                                    std::span<AttributeLayout* const> layouts,
                                    std::span<const std::optional<std::string_view>> values);
};

}  // namespace zvdb
