#pragma once
// Room for a few values on the stack, or on the heap when they are more: the many calls
// that pass a handful of tags, texts or layouts make no allocation. Not copyable: it points
// into itself.
#include <cstddef>
#include <span>
#include <vector>

namespace zvdb {

template <class T, std::size_t N>
class SmallBuffer {
public:
    SmallBuffer() = default;
    explicit SmallBuffer(std::size_t count) { prepare(count); }
    SmallBuffer(const SmallBuffer&) = delete;
    SmallBuffer& operator=(const SmallBuffer&) = delete;

    // Room for `count` default values, in place of what was there.
    T* prepare(std::size_t count) {
        size_ = count;
        data_ = onStack_;
        if (count > N) {
            onHeap_.assign(count, T());
            data_ = onHeap_.data();
        }
        return data_;
    }
    T* data() { return data_; }
    const T* data() const { return data_; }
    std::size_t size() const { return size_; }
    T& operator[](std::size_t i) { return data_[i]; }
    std::span<T> span() { return {data_, size_}; }
    std::span<const T> span() const { return {data_, size_}; }

private:
    T onStack_[N]{};
    std::vector<T> onHeap_;
    T* data_ = onStack_;
    std::size_t size_ = 0;
};

}  // namespace zvdb
