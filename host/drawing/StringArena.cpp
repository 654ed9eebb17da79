#include "StringArena.h"

#include <cstring>

namespace zvdb {

namespace {
constexpr std::size_t kChunk = 64 * 1024;
}

std::string_view StringArena::store(std::string_view text) {
    if (text.empty()) return {};
    if (text.size() > left_) {
        const std::size_t size = text.size() > kChunk / 4 ? text.size() : kChunk;
        chunks_.push_back(std::make_unique<char[]>(size));
        if (size != kChunk) {
            std::memcpy(chunks_.back().get(), text.data(), text.size());
            used_ += size;
            return {chunks_.back().get(), text.size()};
        }
        cursor_ = chunks_.back().get();
        left_ = size;
        used_ += size;
    }
    std::memcpy(cursor_, text.data(), text.size());
    std::string_view result(cursor_, text.size());
    cursor_ += text.size();
    left_ -= text.size();
    return result;
}

std::string_view StringArena::adopt(std::string&& buffer) {
    used_ += buffer.capacity();
    buffers_.push_back(std::make_unique<std::string>(std::move(buffer)));
    return *buffers_.back();
}

}  // namespace zvdb
