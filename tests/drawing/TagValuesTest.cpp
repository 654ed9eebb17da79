// Reals of tags: a short decimal is read without from_chars, and must come out as the very
// double from_chars gives, bit for bit; everything else still goes through from_chars.
#include "drawing/TagValues.h"

#include <gtest/gtest.h>

#include <bit>
#include <charconv>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

namespace {

using zvdb::TagValues;

// from_chars on a text without blanks or a plus sign, the fallback when it reads nothing.
double reference(const std::string& text, double fallback) {
    double value = fallback;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    return result.ec == std::errc() ? value : fallback;
}

std::uint64_t bits(double value) {
    return std::bit_cast<std::uint64_t>(value);
}

TEST(TagValuesReals, ShortDecimalsAreTheDoublesFromCharsGives) {
    std::mt19937_64 random(22);
    std::vector<std::string> texts;
    for (int i = 0; i < 200000; ++i) {
        // 1 to 17 digits with the point anywhere, some negative, some with leading zeros
        const int count = 1 + static_cast<int>(random() % 17);
        std::string digits;
        for (int d = 0; d < count; ++d)
            digits += static_cast<char>('0' + random() % 10);
        const int point = static_cast<int>(random() % (count + 1));
        std::string text = random() % 3 == 0 ? "-" : "";
        text += digits.substr(0, static_cast<std::size_t>(point));
        if (point < count) text += (point == 0 ? "0." : ".") + digits.substr(point);
        texts.push_back(text);
    }
    for (const char* text : {"0",
                             "-0",
                             "0.0",
                             "-0.0",
                             "0.1",
                             "0.3",
                             "1.0",
                             "100.0",
                             "270.0",
                             "-12.5",
                             "999999999999999",
                             "0.000000000000001",
                             "123456789012345",
                             "1234567890123456",
                             "9007199254740993",
                             "0.30000000000000004",
                             "123.456789012345",
                             "5e-324",
                             "1e5",
                             "1.5e3",
                             "2.",
                             ".5",
                             "1.5x",
                             "--1",
                             "-",
                             "x",
                             "1..2",
                             "inf",
                             "nan"})
        texts.emplace_back(text);
    int differ = 0;
    for (const std::string& text : texts) {
        const double read = TagValues::toReal(text, 7.25);
        const double expected = reference(text, 7.25);
        if (bits(read) != bits(expected) && ++differ < 10)
            ADD_FAILURE() << text << ": " << read << " instead of " << expected;
    }
    EXPECT_EQ(differ, 0);
    EXPECT_EQ(bits(TagValues::toReal("-0")), bits(-0.0));
    EXPECT_EQ(TagValues::toReal("0.1"), 0.1);
    EXPECT_EQ(TagValues::toReal("-12.5"), -12.5);
}

TEST(TagValuesReals, BlanksAPlusSignAndTextThatIsNoNumber) {
    EXPECT_EQ(TagValues::toReal("  150.25\r"), 150.25);
    EXPECT_EQ(TagValues::toReal("\t+3.5 "), 3.5);
    EXPECT_EQ(TagValues::toReal("+-2.5"), -2.5);
    EXPECT_EQ(TagValues::toReal("", 4.0), 4.0);
    EXPECT_EQ(TagValues::toReal("  ", 4.0), 4.0);
    EXPECT_EQ(TagValues::toReal("abc", 4.0), 4.0);
    // what from_chars reads of a longer text
    EXPECT_EQ(TagValues::toReal("12.5abc"), 12.5);
    EXPECT_EQ(TagValues::toReal("2.5e2"), 250.0);
    EXPECT_EQ(TagValues::toReal("7."), 7.0);
}

}  // namespace

namespace {

TEST(TagValuesNames, NamesMatchWithoutRegardToTheCaseOfLettersOnly) {
    EXPECT_TRUE(TagValues::sameName("KVR_ZV_WIRE", "KVR_ZV_WIRE"));
    EXPECT_TRUE(TagValues::sameName("kvr_zv_wire", "KVR_ZV_WIRE"));
    EXPECT_TRUE(TagValues::sameName("Kvr_Zv_Wire", "kVR_zV_wIRE"));
    EXPECT_TRUE(TagValues::sameName("", ""));
    EXPECT_FALSE(TagValues::sameName("KVR_ZV_WIRE", "KVR_ZV_CABO"));
    EXPECT_FALSE(TagValues::sameName("KVR_ZV_WIRE", "KVR_ZV_WIRF"));
    EXPECT_FALSE(TagValues::sameName("KVR_ZV", "KVR_ZV_WIRE"));
    EXPECT_FALSE(TagValues::sameName("KVR_ZV_WIRE", "KVR_ZV"));
    // Only letters fold: signs 32 apart stay apart.
    EXPECT_FALSE(TagValues::sameName("A@", "A`"));
    EXPECT_FALSE(TagValues::sameName("[", "{"));
    EXPECT_FALSE(TagValues::sameName("a1", "A\x11"));
}

}  // namespace
