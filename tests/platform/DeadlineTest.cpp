#include "platform/Deadline.h"

#include <gtest/gtest.h>

#include <thread>

namespace ventras {
namespace {

using namespace std::chrono_literals;

TEST(Deadline, PassesWhenItsTimeIsOver) {
    const auto deadline = Deadline::after(50ms);
    EXPECT_FALSE(deadline.passed());
    EXPECT_GT(deadline.remaining(), 0ms);
    EXPECT_LE(deadline.remaining(), 50ms);
    std::this_thread::sleep_until(deadline.moment());
    EXPECT_TRUE(deadline.passed());
}

TEST(Deadline, NeverHasLessThanNothingLeft) {
    EXPECT_EQ(Deadline::after(-10s).remaining(), 0ms);
    EXPECT_TRUE(Deadline::after(-10s).passed());
    EXPECT_TRUE(Deadline::after(0ms).passed());
}

}  // namespace
}  // namespace ventras
