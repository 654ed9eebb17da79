#include "Dictionary.h"

#include "Database.h"
#include "TagValues.h"
#include "XRecord.h"

namespace zvdb {

Dictionary::~Dictionary() = default;

namespace {
bool isEntryPointer(int code) {
    return code == 350 || code == 360;
}
}  // namespace

std::vector<Dictionary::Entry> Dictionary::entries() const {
    std::vector<Entry> result;
    const auto all = tags();
    const std::size_t end = xdataStart();
    for (std::size_t i = headerEnd(); i + 1 < end; ++i) {
        if (all[i].code != 3 || !isEntryPointer(all[i + 1].code)) continue;
        const std::uint64_t handle = TagValues::toHandle(all[i + 1].value);
        if (database().objectByHandle(handle)) result.push_back(Entry{all[i].value, handle});
        ++i;
    }
    return result;
}

const Dictionary::Index& Dictionary::index() const {
    if (!index_) {
        index_ = std::make_unique<Index>();
        const auto all = tags();
        const std::size_t end = xdataStart();
        for (std::size_t i = headerEnd(); i + 1 < end; ++i) {
            if (all[i].code == 3 && isEntryPointer(all[i + 1].code)) {
                const std::uint64_t handle = TagValues::toHandle(all[i + 1].value);
                if (index_->byName.try_emplace(TagValues::upperName(all[i].value), handle).second)
                    index_->positionOf.try_emplace(handle, i);
                ++i;
            }
        }
    }
    return *index_;
}

std::uint64_t Dictionary::handleOf(std::string_view name) const {
    const auto& byName = index().byName;
    const auto it = byName.find(TagValues::upperName(name));
    if (it == byName.end() || !database().objectByHandle(it->second)) return 0;
    return it->second;
}

DbObject* Dictionary::get(std::string_view name) const {
    return database().objectByHandle(handleOf(name));
}

Dictionary* Dictionary::getDictionary(std::string_view name) const {
    return dynamic_cast<Dictionary*>(get(name));
}

XRecord* Dictionary::getXRecord(std::string_view name) const {
    return dynamic_cast<XRecord*>(get(name));
}

void Dictionary::setAt(std::string_view name, DbObject& object) {
    const auto& byName = index().byName;
    if (const auto it = byName.find(TagValues::upperName(name)); it != byName.end()) {
        DbObject* old = database().objectByHandle(it->second);
        if (old == &object) return;
        remove(name);
        if (old) old->erase();
    }
    object.setOwner(handle());
    const std::int16_t code = isHardOwner() ? 360 : 350;
    const std::size_t at = xdataStart();
    const Tag entry[2] = {Tag{3, store(name)},
                          Tag{code, store(TagValues::fromHandle(object.handle()))}};
    auto& all = editTags();
    all.insert(all.begin() + static_cast<std::ptrdiff_t>(at), entry, entry + 2);
    index_->byName[TagValues::upperName(name)] = object.handle();
    index_->positionOf[object.handle()] = at;
}

void Dictionary::removeAt(std::size_t position) {
    auto& all = editTags();
    index_->byName.erase(TagValues::upperName(all[position].value));
    index_->positionOf.erase(TagValues::toHandle(all[position + 1].value));
    all[position].code = kRemovedTag;
    all[position + 1].code = kRemovedTag;
    if (++removedMarks_ < 64 || removedMarks_ * 2 < index_->byName.size()) return;
    std::erase_if(all, [](const Tag& tag) { return tag.code == kRemovedTag; });
    removedMarks_ = 0;
    index_.reset();
}

bool Dictionary::remove(std::string_view name) {
    const auto& byName = index().byName;
    const auto it = byName.find(TagValues::upperName(name));
    if (it == byName.end()) return false;
    removeAt(index_->positionOf.at(it->second));
    return true;
}

void Dictionary::forgetEntry(std::uint64_t handle) {
    const auto& positions = index().positionOf;
    const auto it = positions.find(handle);
    if (it != positions.end()) removeAt(it->second);
}

Dictionary* Dictionary::getOrCreateDictionary(std::string_view name) {
    if (Dictionary* existing = getDictionary(name)) return existing;
    Dictionary* created = database().createDictionary(*this);
    setAt(name, *created);
    return created;
}

XRecord* Dictionary::getOrCreateXRecord(std::string_view name) {
    if (XRecord* existing = getXRecord(name)) return existing;
    XRecord* created = database().createXRecord(*this);
    setAt(name, *created);
    return created;
}

bool Dictionary::isHardOwner() const {
    // The flag stands before the entries; a long dictionary is not searched to its end.
    const auto all = tags();
    for (std::size_t i = headerEnd(); i < all.size() && all[i].code != 3; ++i)
        if (all[i].code == 280) return TagValues::toInteger(all[i].value) == 1;
    return false;
}

void Dictionary::erase() {
    if (isErased()) return;
    const auto owned = entries();
    DbObject::erase();
    for (const Entry& entry : owned) {
        DbObject* object = database().objectByHandle(entry.handle);
        if (object && object->ownerHandle() == handle()) object->erase();
    }
}

}  // namespace zvdb
