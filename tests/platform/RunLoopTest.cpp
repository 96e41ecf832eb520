#include "platform/RunLoop.h"

#include <glib.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <thread>
#include <vector>

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

TEST(RunLoop, RunsUntilItsDeadline) {
    RunLoop loop;
    const auto begin = Clock::now();
    loop.runUntil(Deadline::after(100ms));
    EXPECT_GE(Clock::now() - begin, 98ms);
    EXPECT_LT(Clock::now() - begin, 2s);
}

TEST(RunLoop, ReturnsAtOnceWhenTheDeadlineHasPassed) {
    RunLoop loop;
    const auto begin = Clock::now();
    loop.runUntil(Deadline::after(-1s));
    EXPECT_LT(Clock::now() - begin, 1s);
}

TEST(RunLoop, IsStoppedFromItsOwnThread) {
    RunLoop loop;
    g_idle_add(
        [](gpointer self) -> gboolean {
            static_cast<RunLoop*>(self)->stop();
            return G_SOURCE_REMOVE;
        },
        &loop);
    const auto begin = Clock::now();
    loop.runUntil(Deadline::after(30s));
    EXPECT_LT(Clock::now() - begin, 5s);
}

TEST(RunLoop, IsStoppedFromAnotherThread) {
    RunLoop loop;
    const std::jthread other([&] {
        std::this_thread::sleep_for(50ms);
        loop.stop();
    });
    const auto begin = Clock::now();
    loop.runUntil(Deadline::after(30s));
    EXPECT_LT(Clock::now() - begin, 5s);
}

TEST(RunLoop, RunsAgainAfterAStop) {
    RunLoop loop;
    loop.stop();
    const auto begin = Clock::now();
    loop.runUntil(Deadline::after(100ms));
    EXPECT_GE(Clock::now() - begin, 98ms) << "a stop before the run must not end it";
}

TEST(RunLoop, HandlesEventsOfItsMainContext) {
    RunLoop loop;
    int ticks = 0;
    const auto timer = g_timeout_add(
        5,
        [](gpointer count) -> gboolean {
            ++*static_cast<int*>(count);
            return G_SOURCE_CONTINUE;
        },
        &ticks);
    loop.runUntil(Deadline::after(200ms));
    g_source_remove(timer);
    EXPECT_GT(ticks, 2);
}

TEST(PerformOnMainThread, CallsDirectlyWhenAlreadyThere) {
    RunLoop loop;
    bool ran = false;
    loop.performOnMainThread([&] { ran = true; });
    EXPECT_TRUE(ran);
}

TEST(PerformOnMainThread, RunsOnTheMainThreadAndWaitsForIt) {
    RunLoop loop;
    std::thread::id ranOn;
    bool hadRunOnReturn = false;
    const std::jthread worker([&] {
        loop.performOnMainThread([&] {
            std::this_thread::sleep_for(50ms);
            ranOn = std::this_thread::get_id();
        });
        hadRunOnReturn = ranOn != std::thread::id{};
        loop.stop();
    });
    loop.runUntil(Deadline::after(30s));
    EXPECT_EQ(ranOn, std::this_thread::get_id());
    EXPECT_TRUE(hadRunOnReturn);
}

TEST(PerformOnMainThread, WaitsForARunLoopThatComesLater) {
    RunLoop loop;
    std::atomic<bool> ran = false;
    std::jthread worker([&] { loop.performOnMainThread([&] { ran = true; }); });
    std::this_thread::sleep_for(50ms);
    EXPECT_FALSE(ran);
    loop.runUntil(Deadline::after(0ms));
    worker.join();
    EXPECT_TRUE(ran);
}

TEST(PerformOnMainThread, KeepsTheOrderOfOneThread) {
    RunLoop loop;
    std::vector<int> order;
    const std::jthread worker([&] {
        for (int i = 0; i < 100; ++i)
            loop.performOnMainThread([&order, i] { order.push_back(i); });
        loop.stop();
    });
    loop.runUntil(Deadline::after(30s));
    ASSERT_EQ(order.size(), 100U);
    EXPECT_TRUE(std::ranges::is_sorted(order));
}

TEST(PerformOnMainThread, ServesManyThreadsOneByOne) {
    RunLoop loop;
    constexpr int kThreads = 32;
    constexpr int kCalls = 50;
    int calls = 0;  // guarded by nothing but the main thread
    std::vector<std::jthread> workers;
    for (int i = 0; i < kThreads; ++i)
        workers.emplace_back([&] {
            for (int call = 0; call < kCalls; ++call)
                loop.performOnMainThread([&] {
                    if (++calls == kThreads * kCalls)
                        loop.stop();
                });
        });
    loop.runUntil(Deadline::after(60s));
    EXPECT_EQ(calls, kThreads * kCalls);
}

TEST(PerformOnMainThread, MayBeUsedInsideItself) {
    RunLoop loop;
    int depth = 0;
    const std::jthread worker([&] {
        loop.performOnMainThread([&] {
            ++depth;
            loop.performOnMainThread([&] { ++depth; });
        });
        loop.stop();
    });
    loop.runUntil(Deadline::after(30s));
    EXPECT_EQ(depth, 2);
}

}  // namespace
}  // namespace ventras
