#include "TagPattern.h"

#include <new>
#include <stdexcept>

namespace zvdb {

namespace {

// Marks told apart from any stored value by where their text lives.
constexpr char kHoleText[TagPattern::kMaxHoles + 3] = "0123456789abcdefHO";

}  // namespace

std::string_view TagPattern::hole(std::size_t index) {
    if (index >= kMaxHoles) throw std::logic_error("too many holes in a tag pattern");
    return {kHoleText + index, 1};
}

std::string_view TagPattern::handleHole() {
    return {kHoleText + kMaxHoles, 1};
}

std::string_view TagPattern::ownerHole() {
    return {kHoleText + kMaxHoles + 1, 1};
}

TagPattern::TagPattern(std::span<const Tag> tags, PatternTexts& texts, bool takesXData)
    : texts_(&texts), takesXData_(takesXData) {
    items_.reserve(tags.size());
    for (const Tag& tag : tags) {
        if (tag.code >= 1000 || tag.code == kRemovedTag)
            throw std::logic_error("a tag pattern holds no extended data");
        Item item{tag.code, Kind::Fixed, 0, tag.value};
        const char* at = tag.value.data();
        if (tag.value.size() == 1 && at >= kHoleText && at < kHoleText + kMaxHoles + 2) {
            const auto index = static_cast<std::size_t>(at - kHoleText);
            if (index == kMaxHoles) {
                item.kind = Kind::Handle;
            } else if (index == kMaxHoles + 1) {
                item.kind = Kind::Owner;
            } else {
                item.kind = Kind::Hole;
                item.hole = static_cast<std::uint8_t>(index);
                if (index + 1 > holes_) holes_ = index + 1;
            }
            item.value = {};
        }
        if (tag.code == 102) groups_ = true;
        items_.push_back(item);
    }
    paperSpace_ = fixedFlag(67);
    attributesFollow_ = fixedFlag(66);
}

std::int8_t TagPattern::fixedFlag(int code) const {
    if (groups_) return -1;
    for (std::size_t i = 1; i < items_.size(); ++i) {
        const Item& item = items_[i];
        if (item.code != code) continue;
        if (item.kind != Kind::Fixed) return -1;
        return item.value == "1" ? 1 : item.value == "0" ? 0 : -1;
    }
    return 0;
}

namespace {
// A group of extended data kept beside an object's numbers.
struct XDataRoom {
    const Tag* tags = nullptr;
    std::size_t count = 0;
};
}  // namespace

std::size_t TagPattern::xdataOffset() const {
    return (sizeof(Values) + holes_ * sizeof(std::uint32_t) + 7) & ~std::size_t(7);
}

TagPattern::Values* TagPattern::make(StringArena& arena) const {
    const std::size_t size = takesXData_ ? xdataOffset() + sizeof(XDataRoom)
                                         : sizeof(Values) + holes_ * sizeof(std::uint32_t);
    void* room = arena.allocate(size);
    auto* made = new (room) Values{this};
    std::uint32_t* values = made->values();
    for (std::size_t i = 0; i < holes_; ++i)
        values[i] = 0;
    if (takesXData_) new (static_cast<char*>(room) + xdataOffset()) XDataRoom();
    return made;
}

std::span<const Tag> TagPattern::Values::xdata() const {
    if (!pattern->takesXData_) return {};
    const auto* room = reinterpret_cast<const XDataRoom*>(reinterpret_cast<const char*>(this) +
                                                          pattern->xdataOffset());
    return {room->tags, room->count};
}

void TagPattern::Values::setXData(std::span<const Tag> tags) {
    if (!pattern->takesXData_) throw std::logic_error("the pattern takes no extended data");
    auto* room =
        reinterpret_cast<XDataRoom*>(reinterpret_cast<char*>(this) + pattern->xdataOffset());
    *room = XDataRoom{tags.data(), tags.size()};
}

TagPattern::Lookup TagPattern::find(const Values& values, int code, std::string_view& value) const {
    if (groups_) return Lookup::Unknown;
    // As DbObject::indexOf looks: after the type.
    for (std::size_t i = 1; i < items_.size(); ++i) {
        const Item& item = items_[i];
        if (item.code != code) continue;
        switch (item.kind) {
            case Kind::Fixed:
                value = item.value;
                return Lookup::Found;
            case Kind::Hole:
                value = (*texts_)[values.values()[item.hole]];
                return Lookup::Found;
            case Kind::Handle:
            case Kind::Owner:
                return Lookup::Unknown;
        }
    }
    return Lookup::Absent;
}

int TagPattern::holeOf(int code) const {
    if (groups_) return -1;
    for (std::size_t i = 1; i < items_.size(); ++i)
        if (items_[i].code == code) return items_[i].kind == Kind::Hole ? items_[i].hole : -1;
    return -1;
}

std::string_view TagPattern::hexText(std::uint64_t value, char (&buffer)[20]) {
    std::size_t at = sizeof buffer;
    do {
        buffer[--at] = "0123456789ABCDEF"[value & 15];
        value >>= 4;
    } while (value != 0);
    return {buffer + at, sizeof buffer - at};
}

std::vector<Tag> TagPattern::expand(const Values& values, std::uint64_t handle, std::uint64_t owner,
                                    StringArena& arena) const {
    const std::uint32_t* numbers = values.values();
    const std::span<const Tag> xdata = values.xdata();
    std::vector<Tag> tags;
    tags.reserve(items_.size() + xdata.size());
    for (const Item& item : items_) {
        switch (item.kind) {
            case Kind::Fixed:
                tags.push_back(Tag{item.code, item.value});
                break;
            case Kind::Hole:
                tags.push_back(Tag{item.code, (*texts_)[numbers[item.hole]]});
                break;
            case Kind::Handle:
            case Kind::Owner: {
                char buffer[20];
                const std::string_view text =
                    hexText(item.kind == Kind::Handle ? handle : owner, buffer);
                tags.push_back(Tag{item.code, arena.store(text)});
                break;
            }
        }
    }
    tags.insert(tags.end(), xdata.begin(), xdata.end());
    return tags;
}

}  // namespace zvdb
