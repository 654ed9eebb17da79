#include "HandleIndex.h"

#include <algorithm>

namespace zvdb {

namespace {
// A table this much larger than the objects it holds is not grown further for a handle.
constexpr std::size_t kSpread = 4;
constexpr std::size_t kMinimumTable = 1 << 16;
}  // namespace

DbObject* HandleIndex::find(std::uint64_t handle) const {
    if (handle < table_.size() && table_[handle]) return table_[handle];
    if (far_.empty()) return nullptr;
    const auto it = far_.find(handle);
    return it == far_.end() ? nullptr : it->second;
}

bool HandleIndex::emplace(std::uint64_t handle, DbObject* object) {
    if (handle == 0 || !object || contains(handle)) return false;
    ++count_;
    if (handle >= table_.size()) {
        const std::size_t limit = std::max(kMinimumTable, kSpread * std::max(count_, expected_));
        if (handle >= limit) {
            far_.emplace(handle, object);
            return true;
        }
        const std::size_t grown = std::max<std::size_t>(handle + 1, table_.size() * 3 / 2);
        table_.resize(std::min(grown, limit));
    }
    table_[handle] = object;
    return true;
}

void HandleIndex::reserve(std::size_t count) {
    expected_ = std::max(expected_, count);
    table_.reserve(count + count / 4);
}

std::size_t HandleIndex::bytes() const {
    return table_.capacity() * sizeof(DbObject*) + far_.size() * 32 +
           far_.bucket_count() * sizeof(void*);
}

void HandleIndex::swap(HandleIndex& other) noexcept {
    table_.swap(other.table_);
    far_.swap(other.far_);
    std::swap(count_, other.count_);
    std::swap(expected_, other.expected_);
}

}  // namespace zvdb
