#pragma once
// Storage for tag values that do not live in a file buffer: values set by the program,
// decoded text, converted binary values. Nothing is freed before the arena dies, so every
// view it hands out stays valid for the life of its database.
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace zvdb {

class StringArena {
public:
    std::string_view store(std::string_view text);
    // Keeps a whole buffer (a file's text) and answers a view of it.
    std::string_view adopt(std::string&& buffer);
    std::size_t bytesUsed() const { return used_; }

private:
    std::vector<std::unique_ptr<char[]>> chunks_;
    std::vector<std::unique_ptr<std::string>> buffers_;
    char* cursor_ = nullptr;
    std::size_t left_ = 0;
    std::size_t used_ = 0;
};

}  // namespace zvdb
