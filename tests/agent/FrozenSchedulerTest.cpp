#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/VentrasController.h"
#include "drivers/PPDManager.h"
#include "platform/IppConnection.h"
#include "platform/RunLoop.h"
#include "platform/linux/LinuxPlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;
using Strings = std::vector<std::string>;

constexpr auto kLimit = 1500ms;
constexpr auto kImpatientLimit = 100ms;
constexpr auto kRest = 2s;  // what a run does besides waiting for the scheduler

// The whole agent in this process, with a shorter patience than its own.
class FrozenScheduler : public testing::Test {
protected:
    FrozenScheduler() { IppConnection::setSchedulerLimits(kLimit, kImpatientLimit); }
    ~FrozenScheduler() override {
        scheduler.resume();
        IppConnection::setSchedulerLimits(IppConnection::kSchedulerLimit, IppConnection::kImpatientLimit);
    }

    /// Runs the agent to its end. @return its exit status; absent when it does not end.
    std::optional<std::uint64_t> run(const Strings& arguments) {
        PPDManager drivers(platform.platform());
        VentrasController controller(platform.platform(), drivers);
        EXPECT_EQ(controller.run(arguments), 0);
        const auto limit = Deadline::after(20s);
        while (!controller.done() && !limit.passed())
            platform.platform().runLoop.runUntil(Deadline::after(1s));
        return controller.done() ? std::optional{controller.exitStatus()} : std::nullopt;
    }

    LinuxPlatform platform;
    PrivateScheduler scheduler;
    UseScheduler use{scheduler};
};

TEST_F(FrozenScheduler, ThatStaysSoEndsTheRunWithinTheLimits) {
    const ScriptedPrinter printer({.name = "Office"});
    scheduler.suspend();
    const auto begin = Clock::now();
    const auto status = run({printer.uri()});
    const auto time = Clock::now() - begin;
    ASSERT_TRUE(status);
    EXPECT_NE(*status, 0U);
    EXPECT_GE(time, kLimit);
    EXPECT_LT(time, kLimit + 4 * kImpatientLimit + kRest);
    scheduler.resume();
    EXPECT_EQ(scheduler.queues(), Strings{});
}

TEST_F(FrozenScheduler, IsWaitedForOnceByAllTogether) {
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    Strings uris;
    for (int i = 0; i < 10; ++i) {
        printers.push_back(std::make_unique<ScriptedPrinter>());
        uris.push_back(printers.back()->uri());
    }
    scheduler.suspend();
    const auto begin = Clock::now();
    const auto status = run(uris);
    ASSERT_TRUE(status);
    EXPECT_NE(*status, 0U);
    EXPECT_LT(Clock::now() - begin, kLimit + 10 * 4 * kImpatientLimit + kRest);
}

TEST_F(FrozenScheduler, ThatThawsIsNotHeldAgainstLaterRuns) {
    const ScriptedPrinter printer({.name = "Office"});
    scheduler.suspend();
    EXPECT_NE(run({printer.uri()}), 0U);
    scheduler.resume();
    EXPECT_EQ(run({printer.uri()}), 0U);
    EXPECT_EQ(scheduler.queues(), Strings{"Office"});
}

}  // namespace
}  // namespace ventras
