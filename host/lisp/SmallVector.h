#pragma once
// A vector that keeps its first N elements in place: calls, bindings and the lists of a
// chain being read rarely need more.
#include <utility>
#include <vector>

namespace zvlisp {

template <typename T, int N>
class SmallVector {
public:
    void push_back(T value) {
        if (!spilled_ && size_ < N) {
            inline_[size_++] = std::move(value);
            return;
        }
        if (!spilled_) {
            spill_.reserve(2 * N);
            for (T& item : inline_)
                spill_.push_back(std::move(item));
            spilled_ = true;
        }
        spill_.push_back(std::move(value));
        ++size_;
    }
    void pop_back() {
        --size_;
        if (spilled_)
            spill_.pop_back();
        else
            inline_[size_] = T();
    }
    int size() const { return size_; }
    bool empty() const { return size_ == 0; }
    T* data() { return spilled_ ? spill_.data() : inline_; }
    T& operator[](int i) { return data()[i]; }
    T& back() { return data()[size_ - 1]; }

private:
    T inline_[N];
    std::vector<T> spill_;
    int size_ = 0;
    bool spilled_ = false;
};

}  // namespace zvlisp
