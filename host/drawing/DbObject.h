#pragma once
// One object of a drawing: a table record, an entity or an object of the OBJECTS section.
// Its tags are the truth; typed classes read and write them, so groups we do not know stay
// where they were. Tags read from a file stay in the file's tag list (and those of objects
// made whole at once in the database's arena) until a tag is added or taken out: a new
// value for a tag is written where the tag is. Objects made in numbers from one pattern keep
// only their own values until their tags are asked for.
#include "Geometry.h"
#include "Tag.h"
#include "TagList.h"
#include "TagPattern.h"

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace zvdb {

class Database;
class Dictionary;

class DbObject {
public:
    DbObject(Database& database, std::span<const Tag> tags);
    // For tags just made, whose handle and owner are known (they must be what the tags say).
    DbObject(Database& database, std::span<const Tag> tags, std::uint64_t handle,
             std::uint64_t owner);
    // For an object made from a pattern: `values` (in the database's arena) hold its own.
    DbObject(Database& database, const TagPattern::Values& values, std::uint64_t handle,
             std::uint64_t owner);
    virtual ~DbObject();
    DbObject(const DbObject&) = delete;
    DbObject& operator=(const DbObject&) = delete;
    // Objects take their room from the pool of their size (ObjectPool.h).
    static void* operator new(std::size_t bytes);
    static void operator delete(void* room, std::size_t bytes) noexcept;

    Database& database() const { return *database_; }
    std::string_view type() const;  // "LINE", "DICTIONARY", "LAYER"...
    bool isType(std::string_view type) const { return this->type() == type; }
    std::uint64_t handle() const { return handle_; }
    std::uint64_t ownerHandle() const { return owner_; }
    DbObject* owner() const;
    void setOwner(std::uint64_t owner);
    bool isErased() const { return erased_; }
    // Erases the object and what it owns (sub-entities, extension dictionary); an entry of
    // a dictionary leaves it.
    virtual void erase();

    // Tags --------------------------------------------------------------------------------
    std::span<const Tag> tags() const;
    // Whether the tags are still only a pattern's and the object's own values (then
    // forEachTag gives them without putting them together).
    bool isPatterned() const { return patterned_; }
    // The extended data a patterned object keeps beside its values (none for others).
    std::span<const Tag> patternedXData() const {
        return patterned_ ? pattern_->xdata() : std::span<const Tag>();
    }
    // A patterned object's pattern and values (null for others).
    const TagPattern::Values* patternValues() const { return patterned_ ? pattern_ : nullptr; }
    // Each tag in order, as tags() would give them.
    template <class Visit>
    void forEachTag(Visit&& visit) const {
        if (patterned_) {
            pattern_->pattern->forEach(*pattern_, handle_, owner_, visit);
            return;
        }
        for (const Tag& tag : tags())
            visit(tag.code, tag.value);
    }
    // Index of the first extended-data tag (1001), or the tag count.
    std::size_t xdataStart() const;
    // Index of the first tag with the code, outside application groups (102) and before the
    // extended data, from `from` on; -1 when absent.
    int indexOf(int code, std::size_t from = 1) const;
    bool has(int code) const { return indexOf(code) >= 0; }
    std::string_view text(int code, std::string_view fallback = {}) const;
    // text() for each of the codes, in one walk of the tags.
    template <std::size_t N>
    void texts(const int (&codes)[N], const std::string_view (&fallbacks)[N],
               std::string_view (&values)[N]) const;
    double real(int code, double fallback = 0.0) const;
    long long integer(int code, long long fallback = 0) const;
    // Whether the integer under `code` reads 1. A patterned object's paper-space (67) and
    // attributes-follow (66) flags come from its pattern when the pattern fixes them.
    bool flag(int code) const;
    // A point from `code`, `code + 10` and `code + 20`.
    Point3 point(int code, const Point3& fallback = {}) const;
    std::uint64_t handleAt(int code) const;

    // Sets the first tag with the code, or adds one at the end of `subclass` (a subclass
    // marker, code 100), or before the extended data when there is no such subclass.
    void setText(int code, std::string_view value, std::string_view subclass = {});
    void setReal(int code, double value, std::string_view subclass = {});
    void setInteger(int code, long long value, std::string_view subclass = {});
    void setPoint(int code, const Point3& p, std::string_view subclass = {}, bool withZ = true);
    void removeAll(int code);
    // Replaces all tags; values are copied into the database's storage.
    void replaceTags(std::span<const Tag> tags);
    // The tags for editing in place; values put in must come from Database::store().
    std::vector<Tag>& editTags();

    // Tells the database's attribute layouts when the tags change, so that what was worked
    // out from them is worked out again.
    void watchForLayouts() const { watched_ = true; }

    // Extended data ----------------------------------------------------------------------
    // Application names in order of appearance (a name twice when it has two groups).
    std::vector<std::string_view> xdataApplications() const;
    bool hasXData(std::string_view application) const;
    // The items after the application name of its first group; empty when absent.
    std::vector<Tag> xdata(std::string_view application) const;
    // The same items as they stand in the object's tags, without a copy; valid until the
    // object changes.
    std::span<const Tag> xdataItems(std::string_view application) const;
    // xdataItems() for each of the applications, in one walk of the extended data; one that
    // has no group gets a span with no data.
    void xdataItemsOf(std::span<const std::string_view> applications,
                      std::span<std::span<const Tag>> items) const;
    std::vector<std::vector<Tag>> xdataGroups(std::string_view application) const;
    // Replaces the application's first group (later groups stay) or appends one; the
    // application is registered in the APPID table.
    void setXData(std::string_view application, std::span<const Tag> items);
    // The same with text items (code 1000), as many as `texts`.
    void setXDataTexts(std::string_view application, std::span<const std::string_view> texts);
    // Adds a further group even if the application has one.
    void addXData(std::string_view application, std::span<const Tag> items);
    bool removeXData(std::string_view application);

    // Extension dictionary and reactors --------------------------------------------------
    std::uint64_t extensionDictionaryHandle() const;
    Dictionary* extensionDictionary() const;
    Dictionary* getOrCreateExtensionDictionary();
    std::vector<std::uint64_t> reactors() const;
    void addReactor(std::uint64_t handle);

protected:
    friend class Database;
    friend class DxfLoader;
    void setHandle(std::uint64_t handle);
    void markErased();
    // Edits of this object go to the drawing's log of layer edits instead of changing its
    // shapes (layer records).
    void logEditsAsLayer() { layerRecord_ = true; }
    // Makes the object own these tags (values already in the database's storage).
    void takeTags(std::vector<Tag> tags);
    std::string_view store(std::string_view text) const;
    // Index after the object's opening groups (handle, application groups, owner).
    std::size_t headerEnd() const;
    std::size_t subclassEnd(std::string_view subclass) const;
    std::size_t appGroupEnd(std::string_view group) const;  // index of its "102 }" or 0

private:
    // As editTags, with room for `more` tags when the tags are copied.
    std::vector<Tag>& editTags(std::size_t more);
    void setTagValue(int code, std::string_view value, std::string_view subclass);
    // The tag at `index`, to take a new value where it is.
    Tag& tagForValue(std::size_t index);
    void cacheIdentity();
    // The value of a patterned object's tag without putting its tags together: found
    // (true, `value` set; empty when the tag is absent and `absent` is set) or not known.
    bool patternedText(int code, std::string_view& value, bool& absent) const;
    // Replaces or appends the application's first group, made by `fill` into the `count`
    // tags after its name.
    template <class Fill>
    void setXDataWith(std::string_view application, std::size_t count, Fill&& fill);
    // Puts a patterned object's tags together; they are its own from then on.
    void expand();
    void noteEdit();

    // Gives the object `tags` as its own list, dropping the one it had.
    void ownTags(std::unique_ptr<std::vector<Tag>> tags);
    // Whether own_ holds the tags.
    bool hasOwnList() const { return owned_ && !patterned_; }

    Database* database_;
    // Where the tags are, told by the flags: each object keeps one of the three.
    union {
        const Tag* fileTags_ = nullptr;
        const TagPattern::Values* pattern_;  // when patterned_
        // When owned_ and not patterned_; held apart, as most objects keep their tags in a
        // file's list or the arena and an empty list here would cost each one its room.
        std::vector<Tag>* own_;
    };
    std::uint32_t fileCount_ = 0;
    // Bits, so that the flags take the four bytes beside the count (millions of objects).
    bool owned_ : 1 = false;
    bool erased_ : 1 = false;
    bool patterned_ : 1 = false;
    mutable bool watched_ : 1 = false;
    bool layerRecord_ : 1 = false;

protected:
    // For Entity: whether it is a sub-entity (an ATTRIB, VERTEX or SEQEND under its parent).
    bool subEntity_ : 1 = false;

private:
    std::uint64_t handle_ = 0;
    std::uint64_t owner_ = 0;
};

template <std::size_t N>
void DbObject::texts(const int (&codes)[N], const std::string_view (&fallbacks)[N],
                     std::string_view (&values)[N]) const {
    if (patterned_) {
        for (std::size_t k = 0; k < N; ++k)
            values[k] = text(codes[k], fallbacks[k]);
        return;
    }
    const auto all = tags();
    int found[N];
    TagList::indexesOf(all, codes, found);
    for (std::size_t k = 0; k < N; ++k)
        values[k] = found[k] < 0 ? fallbacks[k] : all[static_cast<std::size_t>(found[k])].value;
}

}  // namespace zvdb
