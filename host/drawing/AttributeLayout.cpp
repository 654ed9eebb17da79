#include "AttributeLayout.h"

#include "Attribute.h"
#include "BlockRecord.h"
#include "Database.h"
#include "Entity.h"
#include "TagList.h"
#include "TagValues.h"

#include <atomic>
#include <bit>
#include <stdexcept>

namespace zvdb {

namespace {

// Stand-ins for the values a reference gives, told apart from any stored value by where
// their text lives.
constexpr char kSlotText[AttributeLayout::SlotCount + 1] = "XYZxyzhr";

std::string_view slotMark(int slot) {
    return {kSlotText + slot, 1};
}

int slotOf(std::string_view value) {
    if (value.size() != 1 || value.data() < kSlotText ||
        value.data() >= kSlotText + AttributeLayout::SlotCount)
        return -1;
    return static_cast<int>(value.data() - kSlotText);
}

std::uint64_t nextSerial() {
    static std::atomic<std::uint64_t> serial{0};
    return serial.fetch_add(1, std::memory_order_relaxed) + 1;
}

}  // namespace

AttributeLayout::AttributeLayout(Database& target, const Attribute& definition)
    : position_(definition.position()),
      alignment_(definition.point(11)),
      height_(definition.height()),
      ownRotation_(definition.rotation()),
      tag_(definition.tag()),
      defaultValue_(definition.textValue()),
      constant_(definition.isConstant()),
      serial_(nextSerial()) {
    // Whether the attribute takes a rotation depends on the reference: both ways are ready.
    plain_ = makeVariant(target, definition, false);
    rotated_ = makeVariant(target, definition, true);
    // Values of a definition of another drawing may go with it: its attributes get whole tags.
    if (&definition.database() == &target) {
        AttributeLayouts& layouts = target.attributeLayouts();
        PatternTexts& texts = layouts.texts();
        std::array<std::string_view, SlotCount> fixed{};
        for (Variant* variant : {&plain_, &rotated_})
            makePatterns(*variant, texts, fixed, variant->patterns, variant->holes);
        // The texts a flat reference's attribute would take for them, as compose gives them.
        fixed[Z] = fixed[AlignZ] = layouts.real(target, 0.0);
        fixed[Height] = layouts.real(target, height_);
        for (Variant* variant : {&plain_, &rotated_})
            makePatterns(*variant, texts, fixed, variant->flatPatterns, variant->flatHoles);
    }
}

void AttributeLayout::makePatterns(const Variant& variant, PatternTexts& texts,
                                   const std::array<std::string_view, SlotCount>& fixed,
                                   std::unique_ptr<TagPattern> (&patterns)[2], Holes& holes) {
    // The handle and owner come from the object; each slot not fixed and the value get a
    // hole.
    std::vector<Tag> tags = variant.tags;
    tags[1].value = TagPattern::handleHole();
    tags[2].value = TagPattern::ownerHole();
    holes.fill(kNoHole);
    std::size_t next = 0;
    for (std::size_t slot = 0; slot <= SlotCount; ++slot) {
        const std::size_t at = slot < SlotCount ? variant.slots[slot] : variant.value;
        if (at == kNone) continue;
        if (slot < SlotCount && fixed[slot].data()) {
            tags[at].value = fixed[slot];
            continue;
        }
        holes[slot] = static_cast<std::uint8_t>(next);
        tags[at].value = TagPattern::hole(next++);
    }
    patterns[0] = std::make_unique<TagPattern>(tags, texts);
    // The paper space flag goes right after the entity's subclass marker.
    tags.insert(tags.begin() + 4, Tag{67, "1"});
    patterns[1] = std::make_unique<TagPattern>(tags, texts);
}

AttributeLayout::Variant AttributeLayout::makeVariant(Database& target, const Attribute& definition,
                                                      bool rotated) const {
    // The same steps as making a bare attribute and setting its properties one by one, with
    // marks where the reference's values go.
    const bool sameDrawing = &definition.database() == &target;
    const auto keep = [&](std::string_view value) {
        return sameDrawing ? value : target.store(value);
    };
    Variant made;
    std::vector<Tag>& all = made.tags;
    all.push_back(Tag{0, "ATTRIB"});
    all.push_back(Tag{5, {}});
    all.push_back(Tag{330, {}});
    all.push_back(Tag{100, "AcDbEntity"});
    const std::string_view layer = definition.layer();
    all.push_back(Tag{8, layer.empty() ? std::string_view("0") : keep(layer)});
    all.push_back(Tag{100, "AcDbText"});
    const auto source = definition.tags();
    const std::size_t end = definition.xdataStart();
    bool started = false;
    for (std::size_t i = 1; i < end; ++i) {
        const Tag& tag = source[i];
        const bool textMarker = tag.code == 100 && tag.value == "AcDbText";
        started = started || textMarker;
        if (!started || textMarker || tag.code == 3) continue;  // the prompt stays behind
        if (tag.code == 100 && tag.value == "AcDbAttributeDefinition")
            all.push_back(Tag{100, "AcDbAttribute"});
        else
            all.push_back(Tag{tag.code, keep(tag.value)});
    }
    const auto setPoint = [&](int code, int first) {
        const std::string_view values[3] = {slotMark(first), slotMark(first + 1),
                                            slotMark(first + 2)};
        TagList::setPoint(all, code, values, "AcDbText");
    };
    setPoint(10, X);
    if (definition.has(11)) setPoint(11, AlignX);
    TagList::setValue(all, 40, slotMark(Height), "AcDbText");
    if (rotated) TagList::setValue(all, 50, slotMark(Rotation), "AcDbText");
    TagList::setValue(all, 62, target.storeShared(TagValues::fromInteger(definition.color())),
                      "AcDbEntity");
    if (definition.has(6)) TagList::setValue(all, 6, keep(definition.linetype()), "AcDbEntity");

    made.slots.fill(kNone);
    for (std::size_t i = 0; i < all.size(); ++i)
        if (const int slot = slotOf(all[i].value); slot >= 0)
            made.slots[static_cast<std::size_t>(slot)] = i;
    const int value = TagList::indexOf(all, 1);
    if (value >= 0) made.value = static_cast<std::size_t>(value);
    return made;
}

bool AttributeLayout::compose(Database& target, std::vector<Tag>& out, const Placement& placement,
                              const std::optional<std::string_view>& value) {
    const bool rotated = placement.rotation != 0.0 || ownRotation_ != 0.0;
    const Variant& variant = rotated ? rotated_ : plain_;
    // The paper space flag goes right after the entity's subclass marker; what comes after
    // moves down by one.
    constexpr std::size_t kFlagAt = 4;
    out.clear();
    out.reserve(variant.tags.size() + 1);
    out.insert(out.end(), variant.tags.begin(), variant.tags.begin() + kFlagAt);
    if (placement.paperSpace) out.push_back(Tag{67, "1"});
    out.insert(out.end(), variant.tags.begin() + kFlagAt, variant.tags.end());
    const std::size_t shift = placement.paperSpace ? 1 : 0;
    out[1].value = placement.handle;
    out[2].value = placement.owner;
    AttributeLayouts& reals = target.attributeLayouts();
    const auto put = [&](int slot, double number) {
        const std::size_t at = variant.slots[static_cast<std::size_t>(slot)];
        if (at != kNone) out[at + shift].value = reals.real(target, number);
    };
    placeNumbers(placement, rotated, variant.slots[AlignX] != kNone, put);
    if (!value) return true;
    if (variant.value == kNone) return false;
    out[variant.value + shift].value = target.store(*value);
    return true;
}

TagPattern::Values* AttributeLayout::composeValues(
    Database& target, const Placement& placement,
    const std::optional<std::string_view>& value) const {
    const bool rotated = placement.rotation != 0.0 || ownRotation_ != 0.0;
    const Variant& variant = rotated ? rotated_ : plain_;
    const std::size_t space = placement.paperSpace ? 1 : 0;
    if (!variant.patterns[space] || (value && variant.value == kNone)) return nullptr;
    const bool aligned = variant.holes[AlignX] != kNoHole;
    double numbers[SlotCount] = {};
    placeNumbers(placement, rotated, aligned,
                 [&](int slot, double number) { numbers[slot] = number; });
    // Only a true zero and the very height are what the flat patterns hold.
    const auto same = [](double a, double b) {
        return std::bit_cast<std::uint64_t>(a) == std::bit_cast<std::uint64_t>(b);
    };
    const bool flat = same(numbers[Z], 0.0) && (!aligned || same(numbers[AlignZ], 0.0)) &&
                      same(numbers[Height], height_);
    const TagPattern* pattern = (flat ? variant.flatPatterns : variant.patterns)[space].get();
    const Holes& holes = flat ? variant.flatHoles : variant.holes;
    TagPattern::Values* made = pattern->make(target.arena());
    std::uint32_t* own = made->values();
    AttributeLayouts& reals = target.attributeLayouts();
    for (std::size_t slot = 0; slot < SlotCount; ++slot)
        if (const std::uint8_t hole = holes[slot]; hole != kNoHole)
            own[hole] = reals.realNumber(target, numbers[slot]);
    // Short values come back from row to row (a section, a colour, a length): kept once.
    if (const std::uint8_t hole = holes[SlotCount]; hole != kNoHole)
        own[hole] = reals.texts().shared(value ? target.storeShared(*value)
                                               : variant.tags[variant.value].value);
    return made;
}

AttributeLayout& AttributeLayouts::layout(Database& target, const Attribute& definition) {
    if (&definition.database() != &target) {
        foreign_ = std::make_unique<AttributeLayout>(target, definition);
        return *foreign_;
    }
    std::unique_ptr<AttributeLayout>& known = byDefinition_[&definition];
    if (!known) {
        known = std::make_unique<AttributeLayout>(target, definition);
        definition.watchForLayouts();
    }
    return *known;
}

void AttributeLayouts::forget(const DbObject& object) {
    plans_.clear();
    const auto known = byDefinition_.find(&object);
    if (known == byDefinition_.end()) return;
    retired_.push_back(std::move(known->second));
    byDefinition_.erase(known);
}

std::span<AttributeLayout* const> AttributeLayouts::variableLayouts(Database& target,
                                                                    const BlockRecord& block,
                                                                    Point3* basePoint) {
    if (&block.database() != &target)
        throw std::invalid_argument("the block of a new reference is one of its own drawing");
    BlockPlan& plan = plans_[&block];
    bool current = plan.entities != 0 && plan.entities == block.entitiesMade();
    for (std::size_t i = 0; current && i < plan.definitions.size(); ++i)
        current = !plan.definitions[i]->isErased();
    if (current) {
        if (basePoint) *basePoint = plan.basePoint;
        return plan.variable;
    }
    plan.definitions.clear();
    plan.variable.clear();
    for (Attribute* definition : block.attributeDefinitions()) {
        AttributeLayout& made = layout(target, *definition);
        plan.definitions.push_back(definition);
        if (!made.isConstant()) plan.variable.push_back(&made);
    }
    plan.entities = block.entitiesMade();
    // The base point is read from the block's BLOCK entity, watched as the definitions are.
    plan.basePoint = block.basePoint();
    if (const Entity* begin = block.blockBegin()) begin->watchForLayouts();
    if (basePoint) *basePoint = plan.basePoint;
    return plan.variable;
}

const TagPattern& AttributeLayouts::seqendPattern(bool paperSpace) {
    std::unique_ptr<TagPattern>& made = seqends_[paperSpace ? 1 : 0];
    if (!made) {
        std::vector<Tag> tags = {Tag{0, "SEQEND"}, Tag{5, TagPattern::handleHole()},
                                 Tag{330, TagPattern::ownerHole()}, Tag{100, "AcDbEntity"}};
        if (paperSpace) tags.push_back(Tag{67, "1"});
        tags.push_back(Tag{8, TagPattern::hole(0)});
        made = std::make_unique<TagPattern>(tags, texts_);
    }
    return *made;
}

const TagPattern& AttributeLayouts::referencePattern(const ReferenceShape& shape) {
    const unsigned key = (shape.paperSpace ? 1u : 0u) | (shape.scaled[0] ? 2u : 0u) |
                         (shape.scaled[1] ? 4u : 0u) | (shape.scaled[2] ? 8u : 0u) |
                         (shape.rotated ? 16u : 0u) | (shape.attributesFollow ? 32u : 0u);
    std::unique_ptr<TagPattern>& made = references_[key];
    if (!made) {
        std::size_t hole = 0;
        std::vector<Tag> tags = {Tag{0, "INSERT"}, Tag{5, TagPattern::handleHole()},
                                 Tag{330, TagPattern::ownerHole()}, Tag{100, "AcDbEntity"}};
        if (shape.paperSpace) tags.push_back(Tag{67, "1"});
        tags.push_back(Tag{8, TagPattern::hole(hole++)});
        tags.push_back(Tag{100, "AcDbBlockReference"});
        for (const int code : {2, 10, 20, 30})
            tags.push_back(Tag{static_cast<std::int16_t>(code), TagPattern::hole(hole++)});
        for (int axis = 0; axis < 3; ++axis)
            if (shape.scaled[axis])
                tags.push_back(Tag{static_cast<std::int16_t>(41 + axis), TagPattern::hole(hole++)});
        if (shape.rotated) tags.push_back(Tag{50, TagPattern::hole(hole++)});
        if (shape.attributesFollow) tags.push_back(Tag{66, "1"});
        made = std::make_unique<TagPattern>(tags, texts_, true);
    }
    return *made;
}

AttributeLayouts::Memo& AttributeLayouts::memo(Database& target, double value) {
    const auto bits = std::bit_cast<std::uint64_t>(value);
    Memo& memo = reals_[slotOf(bits)];
    if (memo.text.empty() || memo.bits != bits)
        memo = Memo{bits, target.storeShared(TagValues::fromReal(value))};
    return memo;
}

std::string_view AttributeLayouts::real(Database& target, double value) {
    return memo(target, value).text;
}

std::uint32_t AttributeLayouts::newRealNumber(Database& target, double value) {
    Memo& known = memo(target, value);
    if (known.number == 0) known.number = texts_.shared(known.text);
    return known.number;
}

}  // namespace zvdb
