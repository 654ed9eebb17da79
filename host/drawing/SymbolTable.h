#pragma once
// One table of the TABLES section (LAYER, LTYPE, BLOCK_RECORD...): its head object and its
// records in order, found by name without regard to case.
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class DbObject;

class SymbolTable {
public:
    SymbolTable(std::string_view name, DbObject* head) : name_(name), head_(head) {}

    std::string_view name() const { return name_; }
    DbObject* head() const { return head_; }
    // The record of this name; null when absent or erased.
    DbObject* find(std::string_view name) const;
    // Records in table order, erased ones left out.
    std::vector<DbObject*> records() const;
    std::size_t size() const;
    void add(DbObject* record);
    // After a record was renamed or erased.
    void reindex();
    // Goes up whenever the index by name is made again or grows.
    std::uint64_t indexChanges() const { return indexChanges_; }
    // Tables made only in memory (block records of an R12 file) are not written.
    bool isWritten() const { return written_; }
    void setWritten(bool written) { written_ = written; }

private:
    // Names are kept in capitals; a name asked for is put in capitals on the stack, not in a
    // string of its own, and looked up as it is.
    struct NameHash {
        using is_transparent = void;
        std::size_t operator()(std::string_view name) const {
            return std::hash<std::string_view>{}(name);
        }
    };

    std::string name_;
    DbObject* head_;
    std::vector<DbObject*> records_;
    std::unordered_map<std::string, DbObject*, NameHash, std::equal_to<>> byName_;
    bool written_ = true;
    std::uint64_t indexChanges_ = 0;
};

}  // namespace zvdb
