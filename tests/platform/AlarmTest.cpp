#include "platform/Alarm.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <optional>
#include <random>
#include <thread>
#include <vector>

#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = Deadline::Clock;

TEST(Alarm, RingsOnceAtItsDeadline) {
    std::atomic<int> rings = 0;
    const auto begin = Clock::now();
    std::atomic<Clock::time_point> moment{begin};
    const Alarm alarm(Deadline::after(100ms), [&] {
        moment = Clock::now();
        ++rings;
        return Alarm::Afterwards::Silent;
    });
    ASSERT_TRUE(comesTrue([&] { return rings >= 1; }, 5s));
    EXPECT_GE(moment.load() - begin, 100ms);
    EXPECT_LT(moment.load() - begin, 600ms);
    std::this_thread::sleep_for(3 * Alarm::kInterval);
    EXPECT_EQ(rings, 1);
}

TEST(Alarm, RingsAgainWhenItWants) {
    std::atomic<int> rings = 0;
    const auto begin = Clock::now();
    const Alarm alarm(Deadline::after(0ms), [&] {
        ++rings;
        return Alarm::Afterwards::RingsAgain;
    });
    EXPECT_TRUE(comesTrue([&] { return rings >= 3; }, 5s));
    EXPECT_GE(Clock::now() - begin, 2 * Alarm::kInterval);
}

TEST(Alarm, DoesNotRingOnceItIsTakenBack) {
    std::atomic<int> rings = 0;
    {
        const Alarm alarm(Deadline::after(100ms), [&] {
            ++rings;
            return Alarm::Afterwards::RingsAgain;
        });
    }
    std::this_thread::sleep_for(200ms);
    EXPECT_EQ(rings, 0);
}

TEST(Alarm, ThatIsSetLaterForAnEarlierMomentRingsFirst) {
    std::mutex mutex;
    std::vector<int> order;
    std::atomic<int> rings = 0;
    const auto ring = [&](int number) {
        return [&, number] {
            const std::lock_guard lock(mutex);
            order.push_back(number);
            ++rings;
            return Alarm::Afterwards::Silent;
        };
    };
    const Alarm late(Deadline::after(400ms), ring(3));
    std::this_thread::sleep_for(50ms);  // the thread sleeps until then by now
    const Alarm soon(Deadline::after(100ms), ring(1));
    const Alarm between(Deadline::after(200ms), ring(2));
    ASSERT_TRUE(comesTrue([&] { return rings >= 3; }, 5s));
    EXPECT_EQ(order, (std::vector{1, 2, 3}));
}

TEST(Alarm, NeverRingsAfterItsEndWhateverTheMoment) {
    constexpr auto kShortest = 0ms, kLongest = 3ms;
    const auto setAndTakeBack = [&](unsigned seed) {
        std::mt19937 random(seed);
        const auto some = [&] {
            return std::chrono::milliseconds(random() % (kLongest - kShortest).count());
        };
        for (int i = 0; i < 200; ++i) {
            const auto isAlive = std::make_unique<bool>(true);  // a sanitizer sees who reads it too late
            const Alarm alarm(Deadline::after(some()), [&isAlive] {
                return *isAlive ? Alarm::Afterwards::RingsAgain : Alarm::Afterwards::Silent;
            });
            std::this_thread::sleep_for(some());
        }
    };
    std::vector<std::jthread> threads;
    for (unsigned seed = 0; seed < 4; ++seed)
        threads.emplace_back(setAndTakeBack, seed);
}

TEST(Alarm, CostsLittleWhenItIsTakenBackInTime) {
    const auto begin = Clock::now();
    for (int i = 0; i < 10'000; ++i)
        const Alarm alarm(Deadline::after(10s), [] { return Alarm::Afterwards::Silent; });
    EXPECT_LT(Clock::now() - begin, 2s);
}

}  // namespace
}  // namespace ventras
