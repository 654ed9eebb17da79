#pragma once
// A vector that keeps its first N elements in place: calls and bindings rarely need more.
#include <utility>
#include <vector>

namespace zvlisp {

template <typename T, int N>
class SmallVector {
public:
    void push_back(T value) {
        if (size_ < N) {
            inline_[size_++] = std::move(value);
            return;
        }
        if (size_ == N) {
            spill_.reserve(2 * N);
            for (T& item : inline_)
                spill_.push_back(std::move(item));
        }
        spill_.push_back(std::move(value));
        ++size_;
    }
    int size() const { return size_; }
    T* data() { return size_ <= N ? inline_ : spill_.data(); }
    T& operator[](int i) { return data()[i]; }

private:
    T inline_[N];
    std::vector<T> spill_;
    int size_ = 0;
};

}  // namespace zvlisp
