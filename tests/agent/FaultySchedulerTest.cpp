#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <thread>

#include "tests/agent/Agent.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::HasSubstr;
using Names = std::vector<std::string>;

constexpr int kNoPermission = 77;

TEST(FaultyScheduler, ThatDiedEndsTheRun) {
    PrivateScheduler scheduler;
    const Agent agent(scheduler);
    const ScriptedPrinter printer;
    scheduler.kill();
    const auto run = agent.run({printer.uri()});
    EXPECT_GT(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs(), Names{});
    EXPECT_LT(run.wallTime, 10s);
    EXPECT_THAT(run.standardError, HasSubstr(printer.uri()));
    EXPECT_EQ(agent.leftovers(), Names{});
}

TEST(FaultyScheduler, ThatNeverRanEndsTheRun) {
    const Agent agent({{"CUPS_SERVER", "/nonexistent/socket"}}, ordinaryUser());
    const ScriptedPrinter printer;
    const auto run = agent.run({printer.uri()});
    EXPECT_GT(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs(), Names{});
    EXPECT_LT(run.wallTime, 10s);
    EXPECT_EQ(agent.leftovers(), Names{});
}

TEST(FaultyScheduler, ThatRefusesTheQueueGivesItsStatus) {
    const PrivateScheduler scheduler({.policy = SchedulerPolicy::refusesAdditions});
    const Agent agent(scheduler);
    const ScriptedPrinter printer;
    const auto run = agent.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, kNoPermission) << run.story();
    EXPECT_EQ(run.queueIDs(), Names{});
    EXPECT_EQ(scheduler.queues(), Names{});
    EXPECT_THAT(run.standardError, HasSubstr(printer.uri()));
    EXPECT_EQ(agent.leftovers(), Names{});
}

TEST(FaultyScheduler, WithTheUsualPolicyServesItsAdministrator) {
    const PrivateScheduler scheduler({.policy = SchedulerPolicy::stock, .user = ordinaryUser()});
    const Agent agent(scheduler);
    const ScriptedPrinter printer({.name = "Office"});
    const auto run = agent.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler.queues(), Names{"Office"});
}

TEST(FaultyScheduler, ThatIsFrozenForAWhileIsWaitedFor) {
    PrivateScheduler scheduler;
    const Agent agent(scheduler);
    const ScriptedPrinter printer({.name = "Office"});
    scheduler.suspend();
    auto running = agent.start({printer.uri()});
    EXPECT_FALSE(running->waitUntilEnded(3s));
    scheduler.resume();
    ASSERT_TRUE(running->waitUntilEnded(20s));
    const auto run = Agent::resultOf(*running);
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler.queues(), Names{"Office"});
}

TEST(FaultyScheduler, ThatDiesBeforeTheQueueIsMadeEndsTheRun) {
    PrivateScheduler scheduler;
    const Agent agent(scheduler);
    const ScriptedPrinter printer({.delay = 1s});
    auto running = agent.start({printer.uri()});
    ASSERT_TRUE(comesTrue([&] { return !printer.requests().empty(); }, 20s));
    scheduler.kill();
    ASSERT_TRUE(running->waitUntilEnded(20s));
    const auto run = Agent::resultOf(*running);
    EXPECT_GT(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs(), Names{});
    EXPECT_THAT(run.standardError, HasSubstr(printer.uri()));
    EXPECT_EQ(agent.leftovers(), Names{});
    scheduler.start();
    EXPECT_EQ(scheduler.queues(), Names{});
}

TEST(FaultyScheduler, ThatDiesAtAnyMomentLeavesWholeQueuesOnly) {
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    Names uris;
    for (int i = 0; i < 20; ++i) {
        printers.push_back(std::make_unique<ScriptedPrinter>());
        uris.push_back(printers.back()->uri());
    }
    for (const auto moment : {20ms, 40ms, 60ms, 90ms, 140ms, 200ms}) {
        PrivateScheduler scheduler;
        const Agent agent(scheduler);
        auto running = agent.start(uris);
        std::this_thread::sleep_for(moment);
        scheduler.kill();
        ASSERT_TRUE(running->waitUntilEnded(30s)) << moment.count() << " ms";
        const auto run = Agent::resultOf(*running);
        EXPECT_EQ(run.signal, 0) << run.story();
        EXPECT_EQ(run.exitStatus == 0, run.queueIDs().size() == uris.size()) << run.story();
        EXPECT_EQ(agent.leftovers(), Names{}) << moment.count() << " ms";
        scheduler.start();
        for (const auto& queue : scheduler.queues())
            EXPECT_NE(scheduler.ppd(queue), "")
                << queue << " is a raw queue after " << moment.count() << " ms";
    }
}

}  // namespace
}  // namespace ventras
