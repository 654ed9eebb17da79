#include "sample/SampleRandom.h"

namespace zvsample {

std::uint64_t SampleRandom::next() {
    std::uint64_t z = (state_ += 0x9E3779B97F4A7C15ULL);
    z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9ULL;
    z = (z ^ (z >> 27)) * 0x94D049BB133111EBULL;
    return z ^ (z >> 31);
}

int SampleRandom::below(int bound) {
    if (bound < 1) return 0;
    return static_cast<int>(next() % static_cast<std::uint64_t>(bound));
}

}  // namespace zvsample
