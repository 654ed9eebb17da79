#pragma once
// A small deterministic generator (splitmix64): the same seed gives the same sequence on every
// platform and library version, which standard distributions do not promise.
#include <cstdint>

namespace zvsample {

class SampleRandom {
public:
    explicit SampleRandom(std::uint64_t seed) : state_(seed) {}
    std::uint64_t next();
    // A number in [0, bound); 0 for a bound below 1.
    int below(int bound);
    // A number in [low, high].
    int between(int low, int high) { return low + below(high - low + 1); }
    // True with the given chance in percent.
    bool chance(int percent) { return below(100) < percent; }

private:
    std::uint64_t state_;
};

}  // namespace zvsample
