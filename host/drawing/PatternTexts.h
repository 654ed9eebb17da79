#pragma once
// The values of the holes of patterned objects, each a number in one table. Most holes of
// objects made in numbers take values that come back again and again (the coordinates of a
// column, a height, a layer): those are kept once and each object holds four bytes for
// them instead of a view of sixteen.
#include <cstdint>
#include <memory>
#include <string_view>
#include <vector>

namespace zvdb {

class PatternTexts {
public:
    // Number 0 is the empty value.
    PatternTexts();
    PatternTexts(const PatternTexts&) = delete;
    PatternTexts& operator=(const PatternTexts&) = delete;

    // A value of one object alone: a number of its own.
    std::uint32_t add(std::string_view text);
    // A value that comes back (a stored view handed out again, as shared reals are): the
    // same view lately given has the same number.
    std::uint32_t shared(std::string_view text);
    std::string_view operator[](std::uint32_t number) const {
        return chunks_[number >> kShift][number & kMask];
    }
    std::size_t size() const { return count_; }

private:
    static constexpr unsigned kShift = 12;
    static constexpr std::uint32_t kMask = (1u << kShift) - 1;
    // Views in chunks of a fixed size: the table grows without moving what it holds.
    std::vector<std::unique_ptr<std::string_view[]>> chunks_;
    std::uint32_t count_ = 0;
    struct Recent {
        const char* data = nullptr;
        std::size_t size = 0;
        std::uint32_t number = 0;
    };
    std::vector<Recent> recent_;
};

}  // namespace zvdb
