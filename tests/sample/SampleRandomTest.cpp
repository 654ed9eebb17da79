// The generator's random numbers are splitmix64: fixed values on every platform, so a seed
// names the same project everywhere.
#include "sample/SampleRandom.h"
#include "sample/StripPlanner.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>

TEST(SampleRandom, FollowsTheSplitmix64Sequence) {
    zvsample::SampleRandom random(0);
    EXPECT_EQ(random.next(), 0xE220A8397B1DCDAFULL);
    EXPECT_EQ(random.next(), 0x6E789E6AA1B965F4ULL);
    EXPECT_EQ(random.next(), 0x06C45D188009454FULL);
}

TEST(SampleRandom, BoundsAreKept) {
    zvsample::SampleRandom random(42);
    int low = 100, high = -100;
    for (int i = 0; i < 10000; ++i) {
        const int n = random.between(-3, 3);
        low = std::min(low, n);
        high = std::max(high, n);
    }
    EXPECT_EQ(low, -3);
    EXPECT_EQ(high, 3);
    EXPECT_EQ(random.below(0), 0);
    EXPECT_EQ(random.below(-5), 0);
}

TEST(StripPlanner, StripsRotateLanguagesAndKeepNumbersRising) {
    zvsample::SampleRandom random(7);
    zvsample::StripPlanner planner(random, "X", 1);
    const auto terminals = planner.plan(2000);
    ASSERT_EQ(terminals.size(), 2000u);
    std::set<int> languages;
    for (std::size_t i = 1; i < terminals.size(); ++i) {
        const auto& a = terminals[i - 1];
        const auto& b = terminals[i];
        languages.insert(b.language);
        if (a.strip == b.strip) {
            EXPECT_GT(b.number, a.number);
            EXPECT_EQ(a.language, b.language);
        }
        EXPECT_EQ(b.standard, b.language == 1 ? "2" : "1");
    }
    EXPECT_EQ(languages.size(), 3u);
    EXPECT_EQ(terminals.front().strip, "X1");
}
