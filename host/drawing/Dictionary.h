#pragma once
// A DICTIONARY object: named entries that point at other objects (dictionaries, Xrecords,
// anything), found by name without regard to case.
#include "DbObject.h"

#include <memory>
#include <string>
#include <unordered_map>

namespace zvdb {

class XRecord;

class Dictionary : public DbObject {
public:
    using DbObject::DbObject;
    ~Dictionary() override;

    struct Entry {
        std::string_view name;
        std::uint64_t handle;
    };
    // Entries in their order; entries whose object is erased are left out.
    std::vector<Entry> entries() const;
    std::size_t size() const { return entries().size(); }
    std::uint64_t handleOf(std::string_view name) const;
    // The entry's object; null when absent or erased.
    DbObject* get(std::string_view name) const;
    Dictionary* getDictionary(std::string_view name) const;
    XRecord* getXRecord(std::string_view name) const;
    // Sets the entry to the object and makes this dictionary its owner; an object that the
    // name pointed at before is erased.
    void setAt(std::string_view name, DbObject& object);
    // Takes the entry out; the object stays (erase it to drop it).
    bool remove(std::string_view name);
    // The sub-dictionary of this name, made when missing.
    Dictionary* getOrCreateDictionary(std::string_view name);
    XRecord* getOrCreateXRecord(std::string_view name);
    bool isHardOwner() const;
    // Erases the dictionary and the objects it owns.
    void erase() override;

protected:
    friend class DbObject;
    void forgetEntry(std::uint64_t handle);

private:
    // Entries by name, and the tag position of each entry by its object's handle.
    struct Index {
        std::unordered_map<std::string, std::uint64_t> byName;
        std::unordered_map<std::uint64_t, std::size_t> positionOf;
    };
    const Index& index() const;
    // Takes the entry at a tag position out; the two tags stay as removed marks (left out by
    // the writer) until there are many, then they are swept away at once.
    void removeAt(std::size_t position);
    mutable std::unique_ptr<Index> index_;
    std::size_t removedMarks_ = 0;
};

}  // namespace zvdb
