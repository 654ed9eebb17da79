#include "SymbolTable.h"

#include "DbObject.h"
#include "TagValues.h"

namespace zvdb {

namespace {
std::string_view recordName(const DbObject& record) {
    return record.text(2);
}
}  // namespace

std::size_t SymbolTable::NameHash::operator()(std::string_view name) const {
    std::size_t hash = 14695981039346656037ull;
    for (const char c : name) {
        hash ^= static_cast<unsigned char>(c >= 'a' && c <= 'z' ? c - 32 : c);
        hash *= 1099511628211ull;
    }
    return hash;
}

bool SymbolTable::SameName::operator()(std::string_view a, std::string_view b) const {
    return TagValues::sameName(a, b);
}

DbObject* SymbolTable::find(std::string_view name) const {
    const auto it = byName_.find(name);
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
    const auto [it, added] = byName_.try_emplace(TagValues::upperName(recordName(*record)), record);
    if (!added && it->second->isErased()) it->second = record;  // the name is free again
}

void SymbolTable::reindex() {
    byName_.clear();
    for (DbObject* record : records_)
        if (!record->isErased())
            byName_.try_emplace(TagValues::upperName(recordName(*record)), record);
}

}  // namespace zvdb
