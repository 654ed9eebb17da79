#pragma once
// The tags that many objects made alike have in common (the attributes of one definition,
// the SEQENDs of one space), with holes where each object's own values go. An object made
// from a pattern keeps only its hole values; its tags are put together when they are asked
// for or changed, and the writer writes them straight from the pattern.
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

    // `tags` with hole marks for values; no extended data (a pattern's objects get theirs
    // as a change).
    explicit TagPattern(std::span<const Tag> tags);

    std::string_view type() const { return items_.empty() ? std::string_view() : items_[0].value; }
    std::size_t holeCount() const { return holes_; }
    std::size_t tagCount() const { return items_.size(); }

    // What an object made from a pattern keeps, in the arena: the pattern, then a value for
    // each hole.
    struct Values {
        const TagPattern* pattern;
        std::string_view* values() { return reinterpret_cast<std::string_view*>(this + 1); }
        const std::string_view* values() const {
            return reinterpret_cast<const std::string_view*>(this + 1);
        }
    };
    // Room for an object's values, every hole empty until the caller fills it in.
    Values* make(StringArena& arena) const;

    // Each tag with its holes filled, in order. Handle and owner text is made on the spot
    // and lives for the call only.
    template <class Visit>
    void forEach(const std::string_view* values, std::uint64_t handle, std::uint64_t owner,
                 Visit&& visit) const {
        for (const Item& item : items_) {
            switch (item.kind) {
                case Kind::Fixed:
                    visit(item.code, item.value);
                    break;
                case Kind::Hole:
                    visit(item.code, values[item.hole]);
                    break;
                case Kind::Handle:
                case Kind::Owner: {
                    char buffer[20];
                    visit(item.code, hexText(item.kind == Kind::Handle ? handle : owner, buffer));
                    break;
                }
            }
        }
    }
    // The whole tag list, the handle and owner text kept by the arena.
    std::vector<Tag> expand(const std::string_view* values, std::uint64_t handle,
                            std::uint64_t owner, StringArena& arena) const;

private:
    enum class Kind : std::uint8_t { Fixed, Hole, Handle, Owner };
    struct Item {
        std::int16_t code;
        Kind kind;
        std::uint8_t hole;
        std::string_view value;
    };
    // Upper-case hexadecimal, as handles are written.
    static std::string_view hexText(std::uint64_t value, char (&buffer)[20]);

    std::vector<Item> items_;
    std::size_t holes_ = 0;
};

}  // namespace zvdb
