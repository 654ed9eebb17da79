// Reals of tags: a short decimal is read without from_chars, and must come out as the very
// double from_chars gives, bit for bit; everything else still goes through from_chars.
#include "drawing/TagValues.h"

#include <gtest/gtest.h>

#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <iterator>
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

// A real as tags write it: to_chars's shortest form, ".0" behind a whole number.
std::string written(double value) {
    char buffer[40];
    const auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
    std::string text(buffer, result.ptr);
    if (text.find_first_of(".en") == std::string::npos) text += ".0";
    return text;
}

TEST(TagValuesReals, AShortRealIsWrittenAsToCharsWritesIt) {
    // Coordinates and sizes of few decimals take a way of their own: each must come out as
    // the general one writes it, in its fixed or its scientific form, and so must any
    // other value.
    std::mt19937_64 random(48);
    std::vector<double> values = {0.0,
                                  -0.0,
                                  1.0,
                                  -1.0,
                                  0.5,
                                  0.1,
                                  0.3,
                                  1e-5,
                                  1e-6,
                                  1e-7,
                                  1.5e-5,
                                  1e-4,
                                  0.0001,
                                  0.00012,
                                  1e4,
                                  1e5,
                                  1.2e5,
                                  1e6,
                                  1e14,
                                  1e15,
                                  1e16,
                                  123e12,
                                  999999999999999.0,
                                  0.1 + 0.2,
                                  1.0 / 3,
                                  2.5e-3,
                                  6.0 * 0.1,
                                  -273.15,
                                  1e300,
                                  5e-324,
                                  1e-300};
    const double scales[] = {1, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6, 1e7};
    for (int i = -20000; i <= 20000; ++i)
        for (const double scale : scales)
            values.push_back(i / scale);
    for (int i = 0; i < 300000; ++i) {
        const auto integer =
            static_cast<std::int64_t>(random() % 2000000000000000ull) - 1000000000000000;
        const double scale = scales[random() % std::size(scales)];
        values.push_back(double(integer % (std::int64_t(1) << (random() % 54))) / scale);
        values.push_back(double(integer) * std::pow(10.0, double(random() % 40) - 20.0));
        values.push_back(std::bit_cast<double>(random()));
    }
    for (int e = -10; e <= 17; ++e)
        for (const double m : {1.0, 1.5, 2.0, 9.0, 9.5, 12.0, 99.0, 120.0})
            for (const double sign : {1.0, -1.0})
                values.push_back(sign * m * std::pow(10.0, e));
    int differ = 0;
    for (const double value : values) {
        const std::string text = TagValues::fromReal(value);
        if (text != written(value) && ++differ < 10)
            ADD_FAILURE() << written(value) << " written as " << text;
    }
    EXPECT_EQ(differ, 0);
    EXPECT_EQ(TagValues::fromReal(150), "150.0");
    EXPECT_EQ(TagValues::fromReal(-12.5), "-12.5");
    EXPECT_EQ(TagValues::fromReal(100000), "1e+05");
    EXPECT_EQ(TagValues::fromReal(0.0001), "1e-04");
    EXPECT_EQ(TagValues::fromReal(0.001), "0.001");
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
