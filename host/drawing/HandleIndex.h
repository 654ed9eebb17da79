#pragma once
// The objects of a drawing by handle. Handles are given out in sequence from 1, so most of
// them index a plain table; the few far above the rest (files from other programs) go to a
// hash map. The table is kept in pages: objects added to a large drawing take new pages, and
// the pages there are stay where they are, neither copied nor touched again.
#include <cstdint>
#include <memory>
#include <unordered_map>
#include <vector>

namespace zvdb {

class DbObject;

class HandleIndex {
public:
    // Null when the handle is not in the index (0 never is).
    DbObject* find(std::uint64_t handle) const {
        const std::uint64_t page = handle >> kPageBits;
        if (page < pages_.size())
            if (DbObject* object = pages_[page][handle & (kPageSize - 1)]) return object;
        return far_.empty() ? nullptr : findFar(handle);
    }
    bool contains(std::uint64_t handle) const { return find(handle) != nullptr; }
    // Adds the object unless the handle is in the index already; false then.
    bool emplace(std::uint64_t handle, DbObject* object);
    // Room for this many handles in the table.
    void reserve(std::size_t count);
    std::size_t size() const { return count_; }
    // Memory held, for the benchmarks.
    std::size_t bytes() const;
    void swap(HandleIndex& other) noexcept;

private:
    static constexpr int kPageBits = 12;
    static constexpr std::uint64_t kPageSize = std::uint64_t(1) << kPageBits;
    // The page of the pages not made: no object stands there, and nothing is written to it.
    static DbObject* const kNoPage[kPageSize];
    // Handles below this stand in the pages (those of no page yet go to one when added).
    std::uint64_t tableLimit() const;
    DbObject* findFar(std::uint64_t handle) const;
    // By page: its handles' objects, read where it was made, or one page of none shared by
    // the pages not made: a look-up reads a page either way.
    std::vector<DbObject* const*> pages_;
    std::vector<std::unique_ptr<DbObject*[]>> made_;
    std::unordered_map<std::uint64_t, DbObject*> far_;
    std::size_t count_ = 0;
    std::size_t expected_ = 0;
};

}  // namespace zvdb
