#pragma once
// Conversions between tag text and numbers, and a builder for new tag lists.
#include "Geometry.h"
#include "Tag.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace zvdb {

class StringArena;

class TagValues {
public:
    static double toReal(std::string_view text, double fallback = 0.0);
    static long long toInteger(std::string_view text, long long fallback = 0);
    static std::uint64_t toHandle(std::string_view text);  // 0 when not hexadecimal
    static std::string fromReal(double value);
    static std::string fromInteger(long long value);
    static std::string fromHandle(std::uint64_t handle);
    // Case-blind comparison of ASCII letters, as the format compares names. Most names
    // compared differ in length: those are told apart here, without a call.
    static bool sameName(std::string_view a, std::string_view b) {
        return a.size() == b.size() && sameLetters(a, b);
    }
    static std::string upperName(std::string_view name);

private:
    // sameName for two names of one length.
    static bool sameLetters(std::string_view a, std::string_view b);
};

// Builds a tag list whose values are stored in an arena.
class TagListBuilder {
public:
    explicit TagListBuilder(StringArena& arena) : arena_(arena) {}
    TagListBuilder& text(int code, std::string_view value);
    TagListBuilder& real(int code, double value);
    TagListBuilder& integer(int code, long long value);
    TagListBuilder& handle(int code, std::uint64_t value);
    TagListBuilder& point(int code, const Point3& p, bool withZ = true);
    TagListBuilder& append(const std::vector<Tag>& tags);
    std::vector<Tag> take() { return std::move(tags_); }

private:
    StringArena& arena_;
    std::vector<Tag> tags_;
};

}  // namespace zvdb
