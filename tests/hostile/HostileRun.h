#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "tests/agent/Agent.h"
#include "tests/parts/PrivateScheduler.h"

namespace ventras {

using Names = std::vector<std::string>;

/// How many times the time and the memory of a release build a run may take.
inline constexpr int kAllowance = VENTRAS_TEST_ALLOWANCE;

/// Filter lines and commands as they stand in a PPD when a text has broken out of its own line.
inline constexpr std::string_view kSmuggled =
    "x\"\n*cupsFilter: \"application/pdf 0 evil\"\n"
    "*cupsFilter2: \"application/pdf application/pdf 0 evil\"\n"
    "*cupsPreFilter: \"application/pdf 0 evil\"\n*FoomaticRIPCommandLine: \"evil\"\n*X: \"";

/// Lines that have the scheduler, or a filter, run "evil".
Names evilLines(const std::string& ppd);

/// Whether a text has nothing that a terminal obeys: no control characters but line ends.
bool isPlain(const std::string& text);

/// A whole run of the agent against something hostile, with a queue of somebody else's on the scheduler.
class HostileRun : public testing::Test {
protected:
    explicit HostileRun(SchedulerOptions options = {}) : scheduler_(std::move(options)) {}

    static constexpr const char* kPresent = "Present";

    void SetUp() override;

    /// What holds after any run, however it went: it ended by itself, said nothing that a terminal obeys,
    /// left no file; each queue that it made is whole and runs nothing of the device's; the other queue is as
    /// it was.
    void expectHarmless(const Agent& agent, const AgentRun& run) const;

    /// Gives a scheduler without drivers one for "MFG:Acme;MDL:Laser;": its filter runs a command line.
    void installDriver() const;

    /// The queues that are not somebody else's.
    Names newQueues() const;

    PrivateScheduler scheduler_;

private:
    std::string before_;
};

}  // namespace ventras
