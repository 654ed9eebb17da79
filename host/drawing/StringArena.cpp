#include "StringArena.h"

#include <cstring>
#include <memory>
#include <type_traits>

namespace zvdb {

namespace {
constexpr std::size_t kChunk = 64 * 1024;
}

std::string_view StringArena::store(std::string_view text) {
    if (text.empty()) return {};
    if (text.size() > left_) return storeInNewChunk(text);
    std::memcpy(cursor_, text.data(), text.size());
    std::string_view result(cursor_, text.size());
    cursor_ += text.size();
    left_ -= text.size();
    return result;
}

std::string_view StringArena::storeInNewChunk(std::string_view text) {
    const std::size_t size = text.size() > kChunk / 4 ? text.size() : kChunk;
    chunks_.push_back(std::make_unique_for_overwrite<char[]>(size));
    used_ += size;
    if (size != kChunk) {
        std::memcpy(chunks_.back().get(), text.data(), text.size());
        return {chunks_.back().get(), text.size()};
    }
    cursor_ = chunks_.back().get();
    left_ = size;
    return store(text);
}

std::span<Tag> StringArena::storeTags(std::span<const Tag> tags) {
    constexpr std::size_t kTagChunk = 4096;
    static_assert(std::is_trivially_copyable_v<Tag> && alignof(Tag) <= alignof(std::max_align_t));
    const auto room = [this](std::size_t count) {
        tagChunks_.push_back(std::make_unique_for_overwrite<std::byte[]>(count * sizeof(Tag)));
        used_ += count * sizeof(Tag);
        return reinterpret_cast<Tag*>(tagChunks_.back().get());
    };
    if (tags.empty()) return {};
    Tag* at = nullptr;
    if (tags.size() > kTagChunk / 8) {
        at = room(tags.size());
    } else {
        if (tags.size() > tagsLeft_) {
            tagCursor_ = room(kTagChunk);
            tagsLeft_ = kTagChunk;
        }
        at = tagCursor_;
        tagCursor_ += tags.size();
        tagsLeft_ -= tags.size();
    }
    std::uninitialized_copy(tags.begin(), tags.end(), at);
    return {at, tags.size()};
}

namespace {
constexpr std::size_t kRawChunk = 32 * 1024;
}

void* StringArena::allocate(std::size_t bytes) {
    bytes = (bytes + 7) & ~std::size_t(7);
    if (bytes > rawLeft_ || bytes > kRawChunk / 8) return allocateInNewChunk(bytes);
    void* at = rawCursor_;
    rawCursor_ += bytes;
    rawLeft_ -= bytes;
    return at;
}

void* StringArena::allocateInNewChunk(std::size_t bytes) {
    if (bytes > kRawChunk / 8) {
        tagChunks_.push_back(std::make_unique_for_overwrite<std::byte[]>(bytes));
        used_ += bytes;
        return tagChunks_.back().get();
    }
    tagChunks_.push_back(std::make_unique_for_overwrite<std::byte[]>(kRawChunk));
    used_ += kRawChunk;
    rawCursor_ = tagChunks_.back().get();
    rawLeft_ = kRawChunk;
    return allocate(bytes);
}

std::string_view StringArena::adopt(std::string&& buffer) {
    used_ += buffer.capacity();
    buffers_.push_back(std::make_unique<std::string>(std::move(buffer)));
    return *buffers_.back();
}

}  // namespace zvdb
