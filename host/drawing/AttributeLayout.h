#pragma once
// What making attributes from a block's definitions needs, worked out once per definition
// instead of once per reference: the new attribute's tags with every value that does not
// depend on the reference already in place, and where the values that do (handle, owner,
// position, alignment point, height, rotation, text value) go. A layout is used only while
// its definition still has the tags it was worked out from.
#include "Geometry.h"
#include "Tag.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class Attribute;
class Database;

class AttributeLayout {
public:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);
    // The values that depend on the reference, by where they go.
    enum Slot { X, Y, Z, AlignX, AlignY, AlignZ, Height, Rotation, SlotCount };

    // `target` is the drawing the attributes go to; values of a definition of another
    // drawing are copied into it.
    AttributeLayout(Database& target, const Attribute& definition);
    // Whether the definition still has the tags the layout was worked out from.
    bool matches(const Attribute& definition) const;
    // The definition's tag, default value and whether it is constant, as they were read.
    std::string_view tag() const { return tag_; }
    std::string_view defaultValue() const { return defaultValue_; }
    bool isConstant() const { return constant_; }
    // A number that no other layout of the program has had: what callers keep about a
    // layout stays good while the layout they find under its definition has the same.
    std::uint64_t serial() const { return serial_; }

    // The part of a placement the layout needs, worked out once per reference.
    struct Placement {
        Transform transform;
        double heightScale = 1.0;
        double rotation = 0.0;  // degrees, added to the definition's own
        bool paperSpace = false;
        std::string_view handle;  // the new attribute's, as text
        std::string_view owner;   // the reference's handle as text
    };
    // The new attribute's tags into `out`, as making a bare attribute and then setting its
    // properties one by one would leave them. `value`, when given, is the text value (values
    // are held by `target` already); false when the definition has no value tag for it to
    // go to (the caller sets it afterwards).
    bool compose(Database& target, std::vector<Tag>& out, const Placement& placement,
                 const std::optional<std::string_view>& value);

private:
    struct Variant {
        std::vector<Tag> tags;  // without the paper space flag
        std::array<std::size_t, SlotCount> slots{};
        std::size_t value = kNone;
    };
    Variant makeVariant(Database& target, const Attribute& definition, bool rotated) const;

    std::vector<Tag> source_;  // the definition's tags when the layout was made
    Point3 position_;
    Point3 alignment_;
    double height_ = 1.0;
    double ownRotation_ = 0.0;
    std::string_view tag_;
    std::string_view defaultValue_;
    bool constant_ = false;
    std::uint64_t serial_;
    // For references that leave the attribute unrotated, and for the others.
    Variant plain_;
    Variant rotated_;
};

// The layouts of one drawing's definitions, and the text of the reals they were given lately.
class AttributeLayouts {
public:
    // The layout of `definition`, made or remade when needed. Definitions of another drawing
    // get a layout of their own each time (their objects may go away meanwhile).
    AttributeLayout& layout(Database& target, const Attribute& definition);
    // A real as tag text, answered from the values given lately when it is one of them.
    std::string_view real(Database& target, double value);

private:
    std::unordered_map<const Attribute*, std::unique_ptr<AttributeLayout>> byDefinition_;
    std::unique_ptr<AttributeLayout> foreign_;
    struct Memo {
        std::uint64_t bits = 0;
        std::string_view text;
    };
    std::array<Memo, 64> reals_{};
};

}  // namespace zvdb
