#pragma once
// The tags that many objects made alike have in common (the attributes of one definition,
// the SEQENDs of one space), with holes where each object's own values go. An object made
// from a pattern keeps only its hole values; its tags are put together when they are asked
// for or changed, and the writer writes them straight from the pattern.
#include "PatternTexts.h"
#include "StringArena.h"
#include "Tag.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace zvdb {

class TagPattern {
public:
    static constexpr std::size_t kMaxHoles = 16;
    // The value that marks hole `index` in the tags given to the constructor.
    static std::string_view hole(std::size_t index);
    // Marks for the object's handle and owner, filled from the object itself.
    static std::string_view handleHole();
    static std::string_view ownerHole();

    // `tags` with hole marks for values, the values being numbers of `texts` (which must
    // outlive the pattern); no extended data. With `takesXData`, an object made from the
    // pattern keeps one group of extended data given later beside its values (other
    // patterns' objects get theirs as a change).
    TagPattern(std::span<const Tag> tags, PatternTexts& texts, bool takesXData = false);

    std::string_view type() const { return items_.empty() ? std::string_view() : items_[0].value; }
    std::size_t holeCount() const { return holes_; }
    std::size_t tagCount() const { return items_.size(); }
    bool takesXData() const { return takesXData_; }
    PatternTexts& texts() const { return *texts_; }

    // What an object made from a pattern keeps, in the arena: the pattern, then the number
    // of each hole's value in the pattern's texts, then, for a pattern that takes extended
    // data, the object's group of it.
    struct Values {
        const TagPattern* pattern;
        std::uint32_t* values() { return reinterpret_cast<std::uint32_t*>(this + 1); }
        const std::uint32_t* values() const {
            return reinterpret_cast<const std::uint32_t*>(this + 1);
        }
        // The extended data (1001 first); empty when none or when the pattern takes none.
        std::span<const Tag> xdata() const;
        void setXData(std::span<const Tag> tags);
    };
    // Room for an object's values, every hole empty until the caller fills it in.
    Values* make(StringArena& arena) const;

    // What a tag of the pattern holds: a value of its own, or one each object gives (a
    // hole's, its handle, its owner).
    enum class Kind : std::uint8_t { Fixed, Hole, Handle, Owner };
    // Each tag of the pattern in order: its code, what it holds, the hole's number (for a
    // hole) and the value (for a fixed tag).
    template <class Visit>
    void forEachItem(Visit&& visit) const {
        for (const Item& item : items_)
            visit(int(item.code), item.kind, item.hole, item.value);
    }
    // The value an object gives one of the pattern's holes.
    std::string_view holeValue(const Values& values, std::size_t hole) const {
        return (*texts_)[values.values()[hole]];
    }
    // Upper-case hexadecimal, as handles are written.
    static std::string_view hexText(std::uint64_t value, char (&buffer)[20]);

    // Each tag with its holes filled, in order. Handle and owner text is made on the spot
    // and lives for the call only.
    template <class Visit>
    void forEach(const Values& values, std::uint64_t handle, std::uint64_t owner,
                 Visit&& visit) const {
        const std::uint32_t* numbers = values.values();
        for (const Item& item : items_) {
            switch (item.kind) {
                case Kind::Fixed:
                    visit(item.code, item.value);
                    break;
                case Kind::Hole:
                    visit(item.code, (*texts_)[numbers[item.hole]]);
                    break;
                case Kind::Handle:
                case Kind::Owner: {
                    char buffer[20];
                    visit(item.code, hexText(item.kind == Kind::Handle ? handle : owner, buffer));
                    break;
                }
            }
        }
        for (const Tag& tag : values.xdata())
            visit(tag.code, tag.value);
    }
    // The whole tag list, the handle and owner text kept by the arena.
    std::vector<Tag> expand(const Values& values, std::uint64_t handle, std::uint64_t owner,
                            StringArena& arena) const;
    // The value of the first tag with the code before the extended data (as
    // DbObject::indexOf finds it), without putting the tags together. Unknown for the
    // handle and owner and when the pattern has application groups.
    enum class Lookup { Unknown, Absent, Found };
    Lookup find(const Values& values, int code, std::string_view& value) const;
    // The hole of the first tag with the code, as find finds it; -1 when that tag is none.
    int holeOf(int code) const;
    // The paper space flag (67) and the attributes-follow flag (66) of every object of the
    // pattern, as DbObject::flag reads them: 1 or 0 when the pattern fixes it for all,
    // -1 when it is the object's own.
    int paperSpaceFlag() const { return paperSpace_; }
    int attributesFollowFlag() const { return attributesFollow_; }

private:
    struct Item {
        std::int16_t code;
        Kind kind;
        std::uint8_t hole;
        std::string_view value;
    };
    // Where a Values' extended data is kept, after its numbers.
    std::size_t xdataOffset() const;

    std::vector<Item> items_;
    std::size_t holes_ = 0;
    PatternTexts* texts_;
    bool takesXData_ = false;
    bool groups_ = false;
    std::int8_t paperSpace_ = -1;
    std::int8_t attributesFollow_ = -1;
    std::int8_t fixedFlag(int code) const;
};

}  // namespace zvdb
