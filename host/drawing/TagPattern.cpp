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

TagPattern::TagPattern(std::span<const Tag> tags) {
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
        items_.push_back(item);
    }
}

TagPattern::Values* TagPattern::make(StringArena& arena) const {
    void* room = arena.allocate(sizeof(Values) + holes_ * sizeof(std::string_view));
    auto* made = new (room) Values{this};
    std::string_view* values = made->values();
    for (std::size_t i = 0; i < holes_; ++i)
        new (values + i) std::string_view();
    return made;
}

std::string_view TagPattern::hexText(std::uint64_t value, char (&buffer)[20]) {
    std::size_t at = sizeof buffer;
    do {
        buffer[--at] = "0123456789ABCDEF"[value & 15];
        value >>= 4;
    } while (value != 0);
    return {buffer + at, sizeof buffer - at};
}

std::vector<Tag> TagPattern::expand(const std::string_view* values, std::uint64_t handle,
                                    std::uint64_t owner, StringArena& arena) const {
    std::vector<Tag> tags;
    tags.reserve(items_.size());
    for (const Item& item : items_) {
        switch (item.kind) {
            case Kind::Fixed:
                tags.push_back(Tag{item.code, item.value});
                break;
            case Kind::Hole:
                tags.push_back(Tag{item.code, values[item.hole]});
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
    return tags;
}

}  // namespace zvdb
