#include "SymbolTable.h"

#include "DbObject.h"
#include "TagValues.h"

namespace zvdb {

namespace {
std::string_view recordName(const DbObject& record) {
    return record.text(2);
}
}  // namespace

DbObject* SymbolTable::find(std::string_view name) const {
    char capitals[128] = {};
    if (name.size() > sizeof capitals) {
        const auto it = byName_.find(TagValues::upperName(name));
        return it == byName_.end() || it->second->isErased() ? nullptr : it->second;
    }
    for (std::size_t i = 0; i < name.size(); ++i)
        capitals[i] = name[i] >= 'a' && name[i] <= 'z' ? static_cast<char>(name[i] - 32) : name[i];
    const auto it = byName_.find(std::string_view(capitals, name.size()));
    if (it == byName_.end() || it->second->isErased()) return nullptr;
    return it->second;
}

std::vector<DbObject*> SymbolTable::records() const {
    std::vector<DbObject*> result;
    result.reserve(records_.size());
    for (DbObject* record : records_)
        if (!record->isErased()) result.push_back(record);
    return result;
}

std::size_t SymbolTable::size() const {
    std::size_t count = 0;
    for (DbObject* record : records_)
        count += record->isErased() ? 0 : 1;
    return count;
}

void SymbolTable::add(DbObject* record) {
    records_.push_back(record);
    ++indexChanges_;
    const auto [it, added] = byName_.try_emplace(TagValues::upperName(recordName(*record)), record);
    if (!added && it->second->isErased()) it->second = record;  // the name is free again
}

void SymbolTable::reindex() {
    byName_.clear();
    ++indexChanges_;
    for (DbObject* record : records_)
        if (!record->isErased())
            byName_.try_emplace(TagValues::upperName(recordName(*record)), record);
}

}  // namespace zvdb
