#include "TagValues.h"

#include "StringArena.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <iterator>

namespace zvdb {

namespace {

std::string_view trimmed(std::string_view text) {
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t'))
        text.remove_prefix(1);
    while (!text.empty() && (text.back() == ' ' || text.back() == '\t' || text.back() == '\r'))
        text.remove_suffix(1);
    if (!text.empty() && text.front() == '+') text.remove_prefix(1);
    return text;
}

char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 32) : c;
}

// Most reals of a drawing are short decimals ("100.0", "-12.5"). With at most 15 digits
// the digits make an exact integer and the power of ten is exact too, so one division,
// which IEEE arithmetic rounds correctly, gives the nearest double: from_chars' answer.
// Anything else (exponents, more digits, other text) is left to from_chars.
bool shortDecimal(std::string_view text, double& value) {
    static constexpr double kPowers[] = {1e0, 1e1, 1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                         1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
    std::size_t i = 0;
    const bool negative = !text.empty() && text[0] == '-';
    if (negative) ++i;
    std::uint64_t digits = 0;
    int count = 0, fraction = 0;
    const std::size_t start = i;
    for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i, ++count)
        digits = digits * 10 + static_cast<std::uint64_t>(text[i] - '0');
    if (i == start || count > 15) return false;
    if (i < text.size() && text[i] == '.') {
        const std::size_t point = ++i;
        for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i, ++count, ++fraction) {
            if (count == 15) return false;
            digits = digits * 10 + static_cast<std::uint64_t>(text[i] - '0');
        }
        if (i == point) return false;
    }
    if (i != text.size()) return false;
    const double magnitude = static_cast<double>(digits) / kPowers[fraction];
    value = negative ? -magnitude : magnitude;
    return true;
}

}  // namespace

double TagValues::toReal(std::string_view text, double fallback) {
    text = trimmed(text);
    double value = fallback;
    if (shortDecimal(text, value)) return value;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    return result.ec == std::errc() ? value : fallback;
}

long long TagValues::toInteger(std::string_view text, long long fallback) {
    text = trimmed(text);
    long long value = fallback;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    if (result.ec == std::errc()) return value;
    // Some writers put reals where integers belong.
    const double real = toReal(text, static_cast<double>(fallback));
    return static_cast<long long>(std::llround(real));
}

std::uint64_t TagValues::toHandle(std::string_view text) {
    text = trimmed(text);
    std::uint64_t value = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value, 16);
    return result.ec == std::errc() && result.ptr == text.data() + text.size() ? value : 0;
}

namespace {

// The digits of a positive integer at `at`; their end.
char* putDigits(char* at, std::uint64_t value, int count) {
    for (int i = count - 1; i >= 0; --i, value /= 10)
        at[i] = char('0' + value % 10);
    return at + count;
}

int digitCount(std::uint64_t value) {
    int count = 1;
    for (; value >= 10; value /= 10)
        ++count;
    return count;
}

// A real of at most six decimals and fifteen digits (the coordinates and sizes a drawing is
// made of) as to_chars's shortest form writes it, found without its search: the fewest
// decimals whose number reads back as the value are its digits, and the form is fixed unless
// the scientific one is shorter. False for any other value, to_chars's own then.
bool shortReal(double value, char (&buffer)[40], std::size_t& length) {
    static constexpr double kScales[] = {1, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6};
    // A double below 1e15 is within a fifth of a unit of the number it rounds to.
    constexpr double kLimit = 1e15;
    if (value == 0 || !(std::fabs(value) < kLimit)) return false;
    int decimals = 0;
    double scaled = 0;
    for (;; ++decimals) {
        if (decimals == int(std::size(kScales))) return false;
        scaled = std::fabs(value) * kScales[decimals];
        if (!(scaled < kLimit)) return false;
        if (std::nearbyint(scaled) / kScales[decimals] == std::fabs(value)) break;
    }
    const auto number = static_cast<std::uint64_t>(std::nearbyint(scaled));
    const int digits = digitCount(number);
    // The significant digits, without the zeros an integer ends in, and the exponent of the
    // first.
    std::uint64_t significant = number;
    int kept = digits;
    while (significant % 10 == 0) {
        significant /= 10;
        --kept;
    }
    const int exponent = digits - 1 - decimals;
    const int exponentDigits = std::max(2, digitCount(std::uint64_t(std::abs(exponent))));
    const int fixedLength =
        decimals == 0 ? digits : (digits > decimals ? digits + 1 : decimals + 2);
    const int scientificLength = kept + (kept > 1 ? 1 : 0) + 2 + exponentDigits;
    char* at = buffer;
    if (value < 0) *at++ = '-';
    if (fixedLength <= scientificLength) {
        if (decimals == 0) {
            at = putDigits(at, number, digits);
            *at++ = '.';
            *at++ = '0';
        } else if (digits > decimals) {
            std::uint64_t whole = number, fraction = 0, scale = 1;
            for (int i = 0; i < decimals; ++i, scale *= 10) {
                fraction += (whole % 10) * scale;
                whole /= 10;
            }
            at = putDigits(at, whole, digits - decimals);
            *at++ = '.';
            at = putDigits(at, fraction, decimals);
        } else {
            *at++ = '0';
            *at++ = '.';
            for (int i = digits; i < decimals; ++i)
                *at++ = '0';
            at = putDigits(at, number, digits);
        }
    } else {
        char mantissa[20] = {};
        putDigits(mantissa, significant, kept);
        *at++ = mantissa[0];
        if (kept > 1) {
            *at++ = '.';
            for (int i = 1; i < kept; ++i)
                *at++ = mantissa[i];
        }
        *at++ = 'e';
        *at++ = exponent < 0 ? '-' : '+';
        at = putDigits(at, std::uint64_t(std::abs(exponent)), exponentDigits);
    }
    length = std::size_t(at - buffer);
    return true;
}

}  // namespace

std::string TagValues::fromReal(double value) {
    char buffer[40];
    std::size_t length = 0;
    if (shortReal(value, buffer, length)) return std::string(buffer, length);
    const auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
    std::string text(buffer, result.ptr);
    if (text.find_first_of(".en") == std::string::npos) text += ".0";
    return text;
}

std::string TagValues::fromInteger(long long value) {
    return std::to_string(value);
}

std::string TagValues::fromHandle(std::uint64_t handle) {
    char buffer[24];
    const auto result = std::to_chars(buffer, buffer + sizeof buffer, handle, 16);
    std::string text(buffer, result.ptr);
    for (char& c : text)
        c = upper(c);
    return text;
}

bool TagValues::sameLetters(std::string_view a, std::string_view b) {
    // Names mostly come in the case they were registered in: a byte that matches as it is
    // is not converted.
    for (std::size_t i = 0; i < a.size(); ++i)
        if (a[i] != b[i] && upper(a[i]) != upper(b[i])) return false;
    return true;
}

std::string TagValues::upperName(std::string_view name) {
    std::string text(name);
    for (char& c : text)
        c = upper(c);
    return text;
}

TagListBuilder& TagListBuilder::text(int code, std::string_view value) {
    tags_.push_back(Tag{static_cast<std::int16_t>(code), arena_.store(value)});
    return *this;
}

TagListBuilder& TagListBuilder::real(int code, double value) {
    return text(code, TagValues::fromReal(value));
}

TagListBuilder& TagListBuilder::integer(int code, long long value) {
    return text(code, TagValues::fromInteger(value));
}

TagListBuilder& TagListBuilder::handle(int code, std::uint64_t value) {
    return text(code, TagValues::fromHandle(value));
}

TagListBuilder& TagListBuilder::point(int code, const Point3& p, bool withZ) {
    real(code, p.x);
    real(code + 10, p.y);
    if (withZ) real(code + 20, p.z);
    return *this;
}

TagListBuilder& TagListBuilder::append(const std::vector<Tag>& tags) {
    for (const Tag& tag : tags)
        text(tag.code, tag.value);
    return *this;
}

}  // namespace zvdb
