#include "PatternTexts.h"

#include <functional>
#include <stdexcept>

namespace zvdb {

namespace {
constexpr std::size_t kRecent = 4096;
}

PatternTexts::PatternTexts() {
    add({});
}

std::uint32_t PatternTexts::add(std::string_view text) {
    if (text.empty() && count_ > 0) return 0;
    if (count_ == ~std::uint32_t(0)) throw std::length_error("too many pattern values");
    if ((count_ & kMask) == 0)
        chunks_.push_back(std::make_unique<std::string_view[]>(std::size_t(kMask) + 1));
    chunks_.back()[count_ & kMask] = text;
    return count_++;
}

std::uint32_t PatternTexts::shared(std::string_view text) {
    if (text.empty()) return 0;
    if (recent_.empty()) recent_.resize(kRecent);
    // Shared values are the same view each time: the place of the text tells them apart.
    const std::size_t hash = std::hash<const void*>{}(text.data()) * 0x9E3779B97F4A7C15ull;
    Recent& slot = recent_[(hash >> 20) % kRecent];
    if (slot.data != text.data() || slot.size != text.size())
        slot = Recent{text.data(), text.size(), add(text)};
    return slot.number;
}

}  // namespace zvdb
