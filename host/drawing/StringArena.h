#pragma once
// Storage for tag values that do not live in a file buffer: values set by the program,
// decoded text, converted binary values; and for the tag lists of objects that are made
// whole at once. Nothing is freed before the arena dies, so every view it hands out stays
// valid for the life of its database.
#include "Tag.h"

#include <cstddef>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace zvdb {

class StringArena {
public:
    std::string_view store(std::string_view text);
    // Keeps a whole buffer (a file's text) and answers a view of it.
    std::string_view adopt(std::string&& buffer);
    // A copy of a tag list (its values must be held already), at its exact size, with no
    // allocation of its own; its owner may change the values in place.
    std::span<Tag> storeTags(std::span<const Tag> tags);
    // Raw room for small records made of pointers and views (8-byte aligned), at no
    // allocation of its own.
    void* allocate(std::size_t bytes);
    std::size_t bytesUsed() const { return used_; }

private:
    // The rare paths, apart from the calls that only move a cursor.
    [[gnu::noinline]] std::string_view storeInNewChunk(std::string_view text);
    [[gnu::noinline]] void* allocateInNewChunk(std::size_t bytes);

    std::vector<std::unique_ptr<char[]>> chunks_;
    std::vector<std::unique_ptr<std::string>> buffers_;
    char* cursor_ = nullptr;
    std::size_t left_ = 0;
    // Raw room for tags: a list is copied in whole, so nothing is set beforehand.
    std::vector<std::unique_ptr<std::byte[]>> tagChunks_;
    Tag* tagCursor_ = nullptr;
    std::size_t tagsLeft_ = 0;
    std::byte* rawCursor_ = nullptr;
    std::size_t rawLeft_ = 0;
    std::size_t used_ = 0;
};

}  // namespace zvdb
