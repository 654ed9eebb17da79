#include "DbObject.h"

#include "Database.h"
#include "Dictionary.h"
#include "ObjectPool.h"
#include "SmallBuffer.h"
#include "TagList.h"
#include "TagValues.h"

#include <algorithm>
#include <memory>
#include <new>
#include <utility>

namespace zvdb {

// A drawing holds millions of objects: a flag more must not make each one bigger.
static_assert(sizeof(DbObject) <= 48, "DbObject grew");

DbObject::DbObject(Database& database, std::span<const Tag> tags)
    : database_(&database),
      fileTags_(tags.data()),
      fileCount_(static_cast<std::uint32_t>(tags.size())) {
    cacheIdentity();
}

DbObject::DbObject(Database& database, std::span<const Tag> tags, std::uint64_t handle,
                   std::uint64_t owner)
    : database_(&database),
      fileTags_(tags.data()),
      fileCount_(static_cast<std::uint32_t>(tags.size())),
      handle_(handle),
      owner_(owner) {}

DbObject::DbObject(Database& database, const TagPattern::Values& values, std::uint64_t handle,
                   std::uint64_t owner)
    : database_(&database),
      pattern_(&values),
      owned_(true),
      patterned_(true),
      handle_(handle),
      owner_(owner) {}

DbObject::~DbObject() {
    if (hasOwnList()) delete own_;
}

void DbObject::ownTags(std::unique_ptr<std::vector<Tag>> tags) {
    std::vector<Tag>* old = hasOwnList() ? own_ : nullptr;
    own_ = tags.release();
    owned_ = true;
    patterned_ = false;
    fileCount_ = 0;
    delete old;
}

void* DbObject::operator new(std::size_t bytes) {
    return pool::take(bytes);
}

void DbObject::operator delete(void* room, std::size_t bytes) noexcept {
    pool::give(room, bytes);
}

std::span<const Tag> DbObject::tags() const {
    if (owned_) {
        // Asking for the tags is no change: a patterned object only puts together what its
        // pattern and values say, once.
        if (patterned_) [[unlikely]]
            const_cast<DbObject*>(this)->expand();
        return *own_;
    }
    return {fileTags_, fileCount_};
}

void DbObject::expand() {
    if (!patterned_) return;
    ownTags(std::make_unique<std::vector<Tag>>(
        pattern_->pattern->expand(*pattern_, handle_, owner_, database_->arena())));
}

void DbObject::noteEdit() {
    if (layerRecord_)
        database_->noteLayerEdit(*this);
    else
        database_->noteChange();
    if (watched_) {
        watched_ = false;
        database_->forgetLayout(*this);
    }
}

std::vector<Tag>& DbObject::editTags() {
    return editTags(0);
}

std::vector<Tag>& DbObject::editTags(std::size_t more) {
    noteEdit();
    if (patterned_) {
        // Put together at its size, then given the room the change asks for: a list
        // doubled for one more tag would keep its spare room for the rest of the run.
        expand();
        if (more) own_->reserve(own_->size() + more);
    }
    if (!owned_) {
        // Copied once at the size the change needs, not copied and then grown.
        auto copy = std::make_unique<std::vector<Tag>>();
        copy->reserve(fileCount_ + more);
        copy->assign(fileTags_, fileTags_ + fileCount_);
        ownTags(std::move(copy));
    }
    return *own_;
}

void DbObject::takeTags(std::vector<Tag> tags) {
    noteEdit();
    ownTags(std::make_unique<std::vector<Tag>>(std::move(tags)));
    cacheIdentity();
}

std::string_view DbObject::store(std::string_view text) const {
    return database_->store(text);
}

std::string_view DbObject::type() const {
    if (patterned_) return pattern_->pattern->type();
    const auto all = tags();
    return all.empty() ? std::string_view() : all[0].value;
}

void DbObject::cacheIdentity() {
    const auto all = tags();
    const int handleCode = type() == "DIMSTYLE" ? 105 : 5;
    handle_ = 0;
    owner_ = 0;
    bool inGroup = false;
    for (std::size_t i = 1; i < all.size(); ++i) {
        const Tag& tag = all[i];
        if (tag.code == 100 || tag.code == 1001) break;
        if (TagList::opensGroup(tag))
            inGroup = true;
        else if (TagList::closesGroup(tag))
            inGroup = false;
        else if (inGroup)
            continue;
        else if (tag.code == handleCode && handle_ == 0)
            handle_ = TagValues::toHandle(tag.value);
        else if (tag.code == 330 && owner_ == 0)
            owner_ = TagValues::toHandle(tag.value);
    }
}

DbObject* DbObject::owner() const {
    return database_->objectByHandle(owner_);
}

void DbObject::setOwner(std::uint64_t owner) {
    owner_ = owner;
    const std::string_view value = store(TagValues::fromHandle(owner));
    auto& all = editTags();
    bool inGroup = false;
    std::size_t i = 1;
    for (; i < all.size(); ++i) {
        const Tag& tag = all[i];
        if (TagList::opensGroup(tag)) {
            inGroup = true;
        } else if (TagList::closesGroup(tag)) {
            inGroup = false;
        } else if (inGroup) {
            continue;
        } else if (tag.code == 330) {
            all[i].value = value;
            return;
        } else if (tag.code != 5 && tag.code != 105) {
            break;
        }
    }
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(i), Tag{330, value});
}

void DbObject::setHandle(std::uint64_t handle) {
    handle_ = handle;
    const std::int16_t code = type() == "DIMSTYLE" ? 105 : 5;
    const std::string_view value = store(TagValues::fromHandle(handle));
    auto& all = editTags();
    for (std::size_t i = 1; i < all.size() && i < 4; ++i) {
        if (all[i].code == code) {
            all[i].value = value;
            return;
        }
    }
    // A table head keeps its name first: readers look for it right after 0/TABLE.
    std::size_t at = all.empty() ? 0 : 1;
    if (type() == "TABLE" && all.size() > 1 && all[1].code == 2) at = 2;
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(at), Tag{code, value});
}

std::size_t DbObject::headerEnd() const {
    const auto all = tags();
    const int handleCode = type() == "DIMSTYLE" ? 105 : 5;
    std::size_t i = 1;
    bool inGroup = false;
    for (; i < all.size(); ++i) {
        const Tag& tag = all[i];
        if (TagList::opensGroup(tag))
            inGroup = true;
        else if (TagList::closesGroup(tag))
            inGroup = false;
        else if (!inGroup && tag.code != handleCode && tag.code != 330)
            break;
    }
    return i;
}

std::size_t DbObject::appGroupEnd(std::string_view group) const {
    const auto all = tags();
    for (std::size_t i = 1; i < all.size(); ++i) {
        if (all[i].code == 100 || all[i].code == 1001) break;
        if (TagList::opensGroup(all[i]) && all[i].value.substr(1) == group) {
            for (std::size_t k = i + 1; k < all.size(); ++k)
                if (TagList::closesGroup(all[k])) return k;
            return 0;
        }
    }
    return 0;
}

std::size_t DbObject::xdataStart() const {
    return TagList::xdataStart(tags());
}

int DbObject::indexOf(int code, std::size_t from) const {
    return TagList::indexOf(tags(), code, from);
}

bool DbObject::patternedText(int code, std::string_view& value, bool& absent) const {
    if (!patterned_) return false;
    switch (pattern_->pattern->find(*pattern_, code, value)) {
        case TagPattern::Lookup::Found:
            absent = false;
            return true;
        case TagPattern::Lookup::Absent:
            absent = true;
            return true;
        case TagPattern::Lookup::Unknown:
            break;
    }
    return false;
}

std::string_view DbObject::text(int code, std::string_view fallback) const {
    // A patterned object answers from its pattern: reading a value leaves it as compact.
    std::string_view value;
    bool absent = false;
    if (patternedText(code, value, absent)) return absent ? fallback : value;
    const int i = indexOf(code);
    return i < 0 ? fallback : tags()[static_cast<std::size_t>(i)].value;
}

double DbObject::real(int code, double fallback) const {
    std::string_view value;
    bool absent = false;
    if (patternedText(code, value, absent))
        return absent ? fallback : TagValues::toReal(value, fallback);
    const int i = indexOf(code);
    return i < 0 ? fallback
                 : TagValues::toReal(tags()[static_cast<std::size_t>(i)].value, fallback);
}

long long DbObject::integer(int code, long long fallback) const {
    std::string_view value;
    bool absent = false;
    if (patternedText(code, value, absent))
        return absent ? fallback : TagValues::toInteger(value, fallback);
    const int i = indexOf(code);
    return i < 0 ? fallback
                 : TagValues::toInteger(tags()[static_cast<std::size_t>(i)].value, fallback);
}

bool DbObject::flag(int code) const {
    if (patterned_ && (code == 66 || code == 67)) {
        const TagPattern& pattern = *pattern_->pattern;
        const int fixed = code == 66 ? pattern.attributesFollowFlag() : pattern.paperSpaceFlag();
        if (fixed >= 0) return fixed == 1;
    }
    return integer(code) == 1;
}

Point3 DbObject::point(int code, const Point3& fallback) const {
    const int i = indexOf(code);
    if (i < 0) return fallback;
    const auto all = tags();
    Point3 p{TagValues::toReal(all[static_cast<std::size_t>(i)].value), 0.0, 0.0};
    std::size_t k = static_cast<std::size_t>(i) + 1;
    if (k < all.size() && all[k].code == code + 10) p.y = TagValues::toReal(all[k++].value);
    if (k < all.size() && all[k].code == code + 20) p.z = TagValues::toReal(all[k].value);
    return p;
}

std::uint64_t DbObject::handleAt(int code) const {
    return TagValues::toHandle(text(code));
}

std::size_t DbObject::subclassEnd(std::string_view subclass) const {
    return TagList::subclassEnd(tags(), subclass);
}

Tag& DbObject::tagForValue(std::size_t index) {
    noteEdit();
    expand();
    // The tags outside own_ are this object's alone (its range of the file's tag list or of
    // the arena), so a value changes there without a copy of the list.
    return owned_ ? (*own_)[index] : const_cast<Tag*>(fileTags_)[index];
}

void DbObject::setTagValue(int code, std::string_view value, std::string_view subclass) {
    if (patterned_) {
        // A new value for a hole is the object's own: the pattern stays.
        const TagPattern& pattern = *pattern_->pattern;
        if (const int hole = pattern.holeOf(code); hole >= 0) {
            noteEdit();
            auto* own = const_cast<TagPattern::Values*>(pattern_);
            own->values()[hole] = pattern.texts().shared(database_->storeShared(value));
            return;
        }
        // A tag it lacks: put together once, with room for it.
        std::string_view found;
        bool absent = false;
        if (patternedText(code, found, absent) && absent) {
            TagList::setValue(editTags(1), code, store(value), subclass);
            return;
        }
    }
    const int i = indexOf(code);
    const std::string_view stored = store(value);
    if (i >= 0)
        tagForValue(static_cast<std::size_t>(i)).value = stored;
    else
        TagList::setValue(editTags(1), code, stored, subclass);
}

void DbObject::setText(int code, std::string_view value, std::string_view subclass) {
    setTagValue(code, value, subclass);
}

void DbObject::setReal(int code, double value, std::string_view subclass) {
    setTagValue(code, TagValues::fromReal(value), subclass);
}

void DbObject::setInteger(int code, long long value, std::string_view subclass) {
    setTagValue(code, TagValues::fromInteger(value), subclass);
}

void DbObject::setPoint(int code, const Point3& p, std::string_view subclass, bool withZ) {
    const std::string_view values[3] = {
        store(TagValues::fromReal(p.x)), store(TagValues::fromReal(p.y)),
        withZ ? store(TagValues::fromReal(p.z)) : std::string_view()};
    const int i = indexOf(code);
    const auto all = tags();
    const std::size_t axes = withZ ? 3 : 2;
    bool whole = i >= 0 && static_cast<std::size_t>(i) + axes <= all.size();
    for (std::size_t axis = 1; whole && axis < axes; ++axis)
        whole = all[static_cast<std::size_t>(i) + axis].code == code + 10 * static_cast<int>(axis);
    if (!whole) {
        TagList::setPoint(editTags(axes), code, values, subclass, withZ);
        return;
    }
    for (std::size_t axis = 0; axis < axes; ++axis)
        tagForValue(static_cast<std::size_t>(i) + axis).value = values[axis];
}

void DbObject::removeAll(int code) {
    for (int i = indexOf(code); i >= 0; i = indexOf(code, static_cast<std::size_t>(i))) {
        auto& all = editTags();
        all.erase(all.begin() + i);
    }
}

void DbObject::replaceTags(std::span<const Tag> tags) {
    std::vector<Tag> copy;
    copy.reserve(tags.size());
    for (const Tag& tag : tags)
        copy.push_back(Tag{tag.code, store(tag.value)});
    editTags() = std::move(copy);
    cacheIdentity();
}

// Extended data ---------------------------------------------------------------------------

std::vector<std::string_view> DbObject::xdataApplications() const {
    std::vector<std::string_view> names;
    const auto all = tags();
    for (std::size_t i = xdataStart(); i < all.size(); ++i)
        if (all[i].code == 1001) names.push_back(all[i].value);
    return names;
}

bool DbObject::hasXData(std::string_view application) const {
    bool found = false;
    TagList::forEachGroupFromEnd(tags(), [&](std::string_view name, std::size_t, std::size_t) {
        found = TagValues::sameName(name, application);
        return !found;
    });
    return found;
}

std::vector<std::vector<Tag>> DbObject::xdataGroups(std::string_view application) const {
    std::vector<std::vector<Tag>> groups;
    const auto all = tags();
    std::vector<Tag>* current = nullptr;
    for (std::size_t i = xdataStart(); i < all.size(); ++i) {
        if (all[i].code == 1001) {
            current = nullptr;
            if (TagValues::sameName(all[i].value, application)) current = &groups.emplace_back();
        } else if (current) {
            current->push_back(all[i]);
        }
    }
    return groups;
}

std::vector<Tag> DbObject::xdata(std::string_view application) const {
    const std::span<const Tag> items = xdataItems(application);
    return std::vector<Tag>(items.begin(), items.end());
}

std::span<const Tag> DbObject::xdataItems(std::string_view application) const {
    const auto all = tags();
    std::span<const Tag> items;
    // Walked from the end: the application's first group is the last one met.
    const auto take = [&](std::string_view name, std::size_t begin, std::size_t end) {
        if (TagValues::sameName(name, application)) items = all.subspan(begin, end - begin);
        return true;
    };
    TagList::forEachGroupFromEnd(all, take);
    return items;
}

void DbObject::xdataItemsOf(std::span<const std::string_view> applications,
                            std::span<std::span<const Tag>> items) const {
    std::fill(items.begin(), items.end(), std::span<const Tag>());
    const auto all = tags();
    const auto take = [&](std::string_view name, std::size_t begin, std::size_t end) {
        for (std::size_t k = 0; k < applications.size(); ++k)
            if (TagValues::sameName(name, applications[k]))
                items[k] = all.subspan(begin, end - begin);
        return true;
    };
    TagList::forEachGroupFromEnd(all, take);
}

namespace {
// Room for `more` tags at the exact size: an object gains extended data once or twice, and
// a list doubled for it would keep its spare room for the rest of the run.
void fitFor(std::vector<Tag>& all, std::size_t more) {
    if (all.size() + more > all.capacity()) all.reserve(all.size() + more);
}

// Where the application's extended-data group lies among the tags (searched from `from`):
// [begin, end), or an empty range at the end when it has none.
std::pair<std::size_t, std::size_t> applicationGroup(std::span<const Tag> tags, std::size_t from,
                                                     std::string_view application) {
    for (std::size_t i = from; i < tags.size(); ++i) {
        if (tags[i].code != 1001 || !TagValues::sameName(tags[i].value, application)) continue;
        std::size_t end = i + 1;
        while (end < tags.size() && tags[end].code != 1001)
            ++end;
        return {i, end};
    }
    return {tags.size(), tags.size()};
}
}  // namespace

template <class Fill>
void DbObject::setXDataWith(std::string_view application, std::size_t count, Fill&& fill) {
    // the same few application names on many objects: one copy each
    const std::string_view name = database_->registeredName(application);
    if (patterned_ && pattern_->pattern->takesXData()) {
        // The groups stay beside the object's values, in the arena at their size, made
        // there at once: the application's first group replaced where it is, or a new one
        // at the end.
        noteEdit();
        const std::span<const Tag> current = pattern_->xdata();
        const auto [begin, end] = applicationGroup(current, 0, application);
        const std::size_t size = current.size() - (end - begin) + count + 1;
        Tag* all = static_cast<Tag*>(database_->arena().allocate(size * sizeof(Tag)));
        Tag* at = std::uninitialized_copy(
            current.begin(), current.begin() + static_cast<std::ptrdiff_t>(begin), all);
        new (at++) Tag{1001, name};
        std::uninitialized_default_construct_n(at, count);
        fill(at);
        std::uninitialized_copy(current.begin() + static_cast<std::ptrdiff_t>(end), current.end(),
                                at + count);
        const_cast<TagPattern::Values*>(pattern_)->setXData({all, size});
        return;
    }
    // The group is made before the tags change: the items may be some of them.
    SmallBuffer<Tag, 16> room(count + 1);
    Tag* group = room.data();
    group[0] = Tag{1001, name};
    fill(group + 1);
    const auto current = tags();
    const auto [begin, end] = applicationGroup(current, xdataStart(), application);
    if (end - begin == count + 1) {
        // As many items as before: the new ones go where the old ones are.
        noteEdit();
        Tag* at = owned_ ? own_->data() : const_cast<Tag*>(fileTags_);
        std::copy(group, group + count + 1, at + begin);
        return;
    }
    // A file object's tags are copied once, at the size they will have. (Made in the arena
    // instead, a symbol that gains groups link after link would leave a copy behind at each.)
    const std::size_t after = current.size() - (end - begin) + count + 1;
    auto& all = editTags(after > current.size() ? after - current.size() : 0);
    all.erase(all.begin() + static_cast<std::ptrdiff_t>(begin),
              all.begin() + static_cast<std::ptrdiff_t>(end));
    fitFor(all, count + 1);
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(begin), group, group + count + 1);
}

void DbObject::setXData(std::string_view application, std::span<const Tag> items) {
    setXDataWith(application, items.size(), [&](Tag* out) {
        for (const Tag& item : items)
            *out++ = Tag{item.code, store(item.value)};
    });
}

void DbObject::setXDataTexts(std::string_view application,
                             std::span<const std::string_view> texts) {
    setXDataWith(application, texts.size(), [&](Tag* out) {
        for (const std::string_view text : texts)
            *out++ = Tag{1000, store(text)};
    });
}

void DbObject::addXData(std::string_view application, std::span<const Tag> items) {
    database_->registerApplication(application);
    auto& all = editTags(items.size() + 1);
    fitFor(all, items.size() + 1);
    all.push_back(Tag{1001, database_->storeShared(application)});
    for (const Tag& item : items)
        all.push_back(Tag{item.code, store(item.value)});
}

bool DbObject::removeXData(std::string_view application) {
    if (!hasXData(application)) return false;
    const std::size_t start = xdataStart();
    auto& all = editTags();
    std::vector<Tag> kept(all.begin(), all.begin() + static_cast<std::ptrdiff_t>(start));
    bool skipping = false;
    for (std::size_t i = start; i < all.size(); ++i) {
        if (all[i].code == 1001) skipping = TagValues::sameName(all[i].value, application);
        if (!skipping) kept.push_back(all[i]);
    }
    all = std::move(kept);
    return true;
}

// Extension dictionary and reactors -------------------------------------------------------

std::uint64_t DbObject::extensionDictionaryHandle() const {
    const std::size_t close = appGroupEnd("ACAD_XDICTIONARY");
    if (close == 0) return 0;
    const auto all = tags();
    for (std::size_t i = close; i-- > 1;) {
        if (TagList::opensGroup(all[i])) break;
        if (all[i].code == 360) return TagValues::toHandle(all[i].value);
    }
    return 0;
}

Dictionary* DbObject::extensionDictionary() const {
    return dynamic_cast<Dictionary*>(database_->objectByHandle(extensionDictionaryHandle()));
}

Dictionary* DbObject::getOrCreateExtensionDictionary() {
    if (Dictionary* existing = extensionDictionary()) return existing;
    Dictionary* dictionary = database_->createDictionary(*this, true);
    const std::size_t reactorsEnd = appGroupEnd("ACAD_REACTORS");
    std::size_t at = reactorsEnd ? reactorsEnd + 1 : std::min<std::size_t>(2, tags().size());
    auto& all = editTags();
    // Drop a stale group (its dictionary is gone) before adding the new one.
    if (const std::size_t stale = appGroupEnd("ACAD_XDICTIONARY")) {
        std::size_t open = stale;
        while (open > 0 && !TagList::opensGroup(all[open]))
            --open;
        all.erase(all.begin() + static_cast<std::ptrdiff_t>(open),
                  all.begin() + static_cast<std::ptrdiff_t>(stale) + 1);
        if (at > open) at = open;
    }
    const Tag group[3] = {Tag{102, "{ACAD_XDICTIONARY"},
                          Tag{360, store(TagValues::fromHandle(dictionary->handle()))},
                          Tag{102, "}"}};
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(at), group, group + 3);
    return dictionary;
}

std::vector<std::uint64_t> DbObject::reactors() const {
    std::vector<std::uint64_t> handles;
    const std::size_t close = appGroupEnd("ACAD_REACTORS");
    if (close == 0) return handles;
    const auto all = tags();
    std::size_t open = close;
    while (open > 0 && !TagList::opensGroup(all[open]))
        --open;
    for (std::size_t i = open + 1; i < close; ++i)
        if (all[i].code == 330) handles.push_back(TagValues::toHandle(all[i].value));
    return handles;
}

void DbObject::addReactor(std::uint64_t handle) {
    const std::string_view value = store(TagValues::fromHandle(handle));
    const std::size_t close = appGroupEnd("ACAD_REACTORS");
    auto& all = editTags();
    if (close) {
        all.insert(all.begin() + static_cast<std::ptrdiff_t>(close), Tag{330, value});
        return;
    }
    const std::size_t at = std::min<std::size_t>(2, all.size());
    const Tag group[3] = {Tag{102, "{ACAD_REACTORS"}, Tag{330, value}, Tag{102, "}"}};
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(at), group, group + 3);
}

void DbObject::markErased() {
    // Noted before the mark: what waits for the next change still sees the object.
    if (layerRecord_)
        database_->noteLayerEdit(*this);
    else
        database_->noteChange();
    erased_ = true;
}

void DbObject::erase() {
    if (erased_) return;
    markErased();
    if (Dictionary* xdict = extensionDictionary()) xdict->erase();
    if (auto* dictionary = dynamic_cast<Dictionary*>(owner())) dictionary->forgetEntry(handle_);
}

}  // namespace zvdb
