#include "tests/parts/ComesTrue.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

TEST(ComesTrue, EndsAsSoonAsTheConditionHolds) {
    const auto begin = Clock::now();
    int asked = 0;
    EXPECT_TRUE(comesTrue([&] { return ++asked == 3; }, 60s));
    EXPECT_EQ(asked, 3);
    EXPECT_LT(Clock::now() - begin, 10s);
}

TEST(ComesTrue, IsFalseWhenTheTimeIsUp) {
    const auto begin = Clock::now();
    EXPECT_FALSE(comesTrue([] { return false; }, 50ms));
    EXPECT_GE(Clock::now() - begin, 50ms);
    EXPECT_LT(Clock::now() - begin, 10s);
}

TEST(ComesTrue, AsksOnceMoreWhenTheTimeIsUp) {
    int asked = 0;
    EXPECT_TRUE(comesTrue([&] { return ++asked == 2; }, 0ms));
    EXPECT_EQ(asked, 2);
}

}  // namespace
}  // namespace ventras
