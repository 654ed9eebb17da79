#pragma once
// What making attributes from a block's definitions needs, worked out once per definition
// instead of once per reference: the new attribute's tags with every value that does not
// depend on the reference already in place, and where the values that do (handle, owner,
// position, alignment point, height, rotation, text value) go. A layout is given up as soon
// as its definition's tags change.
#include "Geometry.h"
#include "Tag.h"
#include "TagPattern.h"

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class Attribute;
class BlockRecord;
class Database;
class DbObject;

class AttributeLayout {
public:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);
    // The values that depend on the reference, by where they go.
    enum Slot { X, Y, Z, AlignX, AlignY, AlignZ, Height, Rotation, SlotCount };

    // `target` is the drawing the attributes go to; values of a definition of another
    // drawing are copied into it.
    AttributeLayout(Database& target, const Attribute& definition);
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
    // The same as a pattern shared by the definition's attributes and the new attribute's
    // own values (the handle and owner come from the object); null when the layout has no
    // patterns (a definition of another drawing) or a value has no tag to go to.
    TagPattern::Values* composeValues(Database& target, const Placement& placement,
                                      const std::optional<std::string_view>& value) const;

private:
    // Each number an attribute placed so takes, by slot: position, alignment point when the
    // layout has one, height, rotation when turned.
    template <class Put>
    void placeNumbers(const Placement& placement, bool rotated, bool aligned, Put&& put) const {
        const Point3 p = placement.transform.apply(position_);
        put(X, p.x);
        put(Y, p.y);
        put(Z, p.z);
        if (aligned) {
            const Point3 a = placement.transform.apply(alignment_);
            put(AlignX, a.x);
            put(AlignY, a.y);
            put(AlignZ, a.z);
        }
        put(Height, height_ * placement.heightScale);
        if (rotated) put(Rotation, ownRotation_ + placement.rotation);
    }

    using Holes = std::array<std::uint8_t, SlotCount + 1>;
    struct Variant {
        std::vector<Tag> tags;  // without the paper space flag
        std::array<std::size_t, SlotCount> slots{};
        std::size_t value = kNone;
        // The same tags as patterns, without and with the paper space flag, and the hole
        // each slot (then the value) fills; kNoHole where it has none.
        std::unique_ptr<TagPattern> patterns[2];
        Holes holes{};
        // The same for attributes of a flat reference (elevation zero, height unscaled), the
        // most: the elevations and the height are the pattern's own texts.
        std::unique_ptr<TagPattern> flatPatterns[2];
        Holes flatHoles{};
    };
    static constexpr std::uint8_t kNoHole = 0xFF;
    Variant makeVariant(Database& target, const Attribute& definition, bool rotated) const;
    // `fixed` holds the text of each slot that the patterns fix, null for the others.
    static void makePatterns(const Variant& variant, PatternTexts& texts,
                             const std::array<std::string_view, SlotCount>& fixed,
                             std::unique_ptr<TagPattern> (&patterns)[2], Holes& holes);

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
    // A definition's tags changed (its layout is made again when next asked for), or a
    // block's base point.
    void forget(const DbObject& object);
    // The layouts of the block's definitions that are not constant, in order: what a new
    // reference of the block takes. Worked out once while the block has the same entities
    // and its definitions the same tags. The block is one of `target`; `basePoint`, when
    // given, takes its base point.
    std::span<AttributeLayout* const> variableLayouts(Database& target, const BlockRecord& block,
                                                      Point3* basePoint = nullptr);
    // A real as tag text, answered from the values given lately when it is one of them.
    std::string_view real(Database& target, double value);
    // The same as a number of texts(), as texts().shared(real(...)) answers it; a value
    // given lately is answered here, without a call.
    std::uint32_t realNumber(Database& target, double value) {
        const auto bits = std::bit_cast<std::uint64_t>(value);
        const Memo& known = reals_[slotOf(bits)];
        // A number is only kept beside the text of the same value.
        if (known.number != 0 && known.bits == bits) return known.number;
        return newRealNumber(target, value);
    }
    // The SEQEND that closes a reference's attributes: its layer is the one hole.
    const TagPattern& seqendPattern(bool paperSpace);
    // A new reference's tags as Database::addBlockReference makes them, for references in
    // paper space or not, with or without each scale and the rotation, and marked or not
    // for attributes: holes for the layer, block name, position and the scales and rotation
    // it has, and room for one group of extended data.
    struct ReferenceShape {
        bool paperSpace = false;
        bool scaled[3] = {false, false, false};
        bool rotated = false;
        bool attributesFollow = false;
    };
    const TagPattern& referencePattern(const ReferenceShape& shape);
    // The values of the holes of every pattern here.
    PatternTexts& texts() { return texts_; }

private:
    // First: the patterns below read it until they go.
    PatternTexts texts_;
    std::unordered_map<const DbObject*, std::unique_ptr<AttributeLayout>> byDefinition_;
    // Layouts given up: attributes made from their patterns still point to them.
    std::vector<std::unique_ptr<AttributeLayout>> retired_;
    std::unique_ptr<AttributeLayout> foreign_;
    std::unique_ptr<TagPattern> seqends_[2];
    std::unique_ptr<TagPattern> references_[64];
    struct BlockPlan {
        std::size_t entities = 0;
        Point3 basePoint;
        std::vector<const Attribute*> definitions;  // every definition, constant ones too
        std::vector<AttributeLayout*> variable;
    };
    std::unordered_map<const BlockRecord*, BlockPlan> plans_;
    struct Memo {
        std::uint64_t bits = 0;
        std::string_view text;
        std::uint32_t number = 0;  // of texts_; 0 until asked for
    };
    Memo& memo(Database& target, double value);
    std::uint32_t newRealNumber(Database& target, double value);
    static std::size_t slotOf(std::uint64_t bits) {
        return static_cast<std::size_t>((bits * 0x9E3779B97F4A7C15ull) >> (64 - kMemoBits));
    }
    // A strip or list page places a few hundred distinct coordinates over and over: the memo
    // holds a page's worth.
    static constexpr int kMemoBits = 10;
    std::array<Memo, std::size_t(1) << kMemoBits> reals_{};
};

}  // namespace zvdb
