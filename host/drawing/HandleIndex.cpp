#include "HandleIndex.h"

#include <algorithm>

namespace zvdb {

namespace {
// A table this much larger than the objects it holds is not grown further for a handle.
constexpr std::size_t kSpread = 4;
constexpr std::size_t kMinimumTable = 1 << 16;
}  // namespace

DbObject* const HandleIndex::kNoPage[HandleIndex::kPageSize] = {};

DbObject* HandleIndex::findFar(std::uint64_t handle) const {
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
    if (page >= made_.size() || !made_[page]) {
        if (handle >= tableLimit()) {
            far_.emplace(handle, object);
            return true;
        }
        if (page >= made_.size()) {
            made_.resize(page + 1);
            pages_.resize(page + 1, kNoPage);
        }
        made_[page] = std::make_unique<DbObject*[]>(kPageSize);
        pages_[page] = made_[page].get();
    }
    made_[page][handle & (kPageSize - 1)] = object;
    return true;
}

void HandleIndex::reserve(std::size_t count) {
    expected_ = std::max(expected_, count);
    const std::size_t pages = (count + count / 4) / kPageSize + 1;
    pages_.reserve(pages);
    made_.reserve(pages);
}

std::size_t HandleIndex::bytes() const {
    std::size_t pages = 0;
    for (const auto& page : made_)
        pages += page ? 1 : 0;
    return pages * kPageSize * sizeof(DbObject*) + 2 * pages_.capacity() * sizeof(void*) +
           far_.size() * 32 + far_.bucket_count() * sizeof(void*);
}

void HandleIndex::swap(HandleIndex& other) noexcept {
    pages_.swap(other.pages_);
    made_.swap(other.made_);
    far_.swap(other.far_);
    std::swap(count_, other.count_);
    std::swap(expected_, other.expected_);
}

}  // namespace zvdb
