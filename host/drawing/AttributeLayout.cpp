#include "AttributeLayout.h"

#include "Attribute.h"
#include "Database.h"
#include "TagList.h"
#include "TagValues.h"

#include <atomic>
#include <bit>

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

bool sameTags(std::span<const Tag> a, std::span<const Tag> b) {
    if (a.size() != b.size()) return false;
    // Stored values are never written over: the same text in the same place is the same value.
    for (std::size_t i = 0; i < a.size(); ++i)
        if (a[i].code != b[i].code || a[i].value.data() != b[i].value.data() ||
            a[i].value.size() != b[i].value.size())
            return false;
    return true;
}

std::uint64_t nextSerial() {
    static std::atomic<std::uint64_t> serial{0};
    return serial.fetch_add(1, std::memory_order_relaxed) + 1;
}

}  // namespace

AttributeLayout::AttributeLayout(Database& target, const Attribute& definition)
    : source_(definition.tags().begin(), definition.tags().end()),
      position_(definition.position()),
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
}

bool AttributeLayout::matches(const Attribute& definition) const {
    return sameTags(definition.tags(), source_);
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
    const Point3 p = placement.transform.apply(position_);
    put(X, p.x);
    put(Y, p.y);
    put(Z, p.z);
    if (variant.slots[AlignX] != kNone) {
        const Point3 a = placement.transform.apply(alignment_);
        put(AlignX, a.x);
        put(AlignY, a.y);
        put(AlignZ, a.z);
    }
    put(Height, height_ * placement.heightScale);
    if (rotated) put(Rotation, ownRotation_ + placement.rotation);
    if (!value) return true;
    if (variant.value == kNone) return false;
    out[variant.value + shift].value = target.store(*value);
    return true;
}

AttributeLayout& AttributeLayouts::layout(Database& target, const Attribute& definition) {
    if (&definition.database() != &target) {
        foreign_ = std::make_unique<AttributeLayout>(target, definition);
        return *foreign_;
    }
    std::unique_ptr<AttributeLayout>& known = byDefinition_[&definition];
    if (!known || !known->matches(definition))
        known = std::make_unique<AttributeLayout>(target, definition);
    return *known;
}

std::string_view AttributeLayouts::real(Database& target, double value) {
    const auto bits = std::bit_cast<std::uint64_t>(value);
    Memo& memo = reals_[(bits * 0x9E3779B97F4A7C15ull) >> 58];
    if (memo.text.empty() || memo.bits != bits)
        memo = Memo{bits, target.storeShared(TagValues::fromReal(value))};
    return memo.text;
}

}  // namespace zvdb
