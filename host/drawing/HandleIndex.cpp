#include "HandleIndex.h"

#include <algorithm>

namespace zvdb {

namespace {
// A table this much larger than the objects it holds is not grown further for a handle.
constexpr std::size_t kSpread = 4;
constexpr std::size_t kMinimumTable = 1 << 16;
}  // namespace

DbObject* HandleIndex::find(std::uint64_t handle) const {
    const std::uint64_t page = handle >> kPageBits;
    if (page < pages_.size() && pages_[page])
        if (DbObject* object = pages_[page][handle & (kPageSize - 1)]) return object;
    if (far_.empty()) return nullptr;
    const auto it = far_.find(handle);
    return it == far_.end() ? nullptr : it->second;
}

std::uint64_t HandleIndex::tableLimit() const {
    return std::max(kMinimumTable, kSpread * std::max(count_, expected_));
}

bool HandleIndex::emplace(std::uint64_t handle, DbObject* object) {
    if (handle == 0 || !object || contains(handle)) return false;
    ++count_;
    const std::uint64_t page = handle >> kPageBits;
    if (page >= pages_.size() || !pages_[page]) {
        if (handle >= tableLimit()) {
            far_.emplace(handle, object);
            return true;
        }
        if (page >= pages_.size()) pages_.resize(page + 1);
        pages_[page] = std::make_unique<DbObject*[]>(kPageSize);
    }
    pages_[page][handle & (kPageSize - 1)] = object;
    return true;
}

void HandleIndex::reserve(std::size_t count) {
    expected_ = std::max(expected_, count);
    pages_.reserve((count + count / 4) / kPageSize + 1);
}

std::size_t HandleIndex::bytes() const {
    std::size_t pages = 0;
    for (const auto& page : pages_)
        pages += page ? 1 : 0;
    return pages * kPageSize * sizeof(DbObject*) + pages_.capacity() * sizeof(void*) +
           far_.size() * 32 + far_.bucket_count() * sizeof(void*);
}

void HandleIndex::swap(HandleIndex& other) noexcept {
    pages_.swap(other.pages_);
    far_.swap(other.far_);
    std::swap(count_, other.count_);
    std::swap(expected_, other.expected_);
}

}  // namespace zvdb
