#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// What a run of the agent left behind.
struct AgentRun : ProgramResult {
    /// The queues that it says it made, in order.
    std::vector<std::string> queueIDs() const;

    /// The only one; empty when it is not exactly one.
    std::string queueID() const;

    /// For a failed test: everything that it said.
    std::string story() const;
};

/// The agent as a program: run by its command line, as the user of a private scheduler, in a temporary folder
/// and a home of its own, without a system bus. One thread at a time.
class Agent {
public:
    explicit Agent(const PrivateScheduler& scheduler) : Agent(scheduler.environment(), scheduler.user()) {}
    Agent(Environment environment, std::optional<uid_t> user);

    /// From now on its errors go where nobody keeps a journal.
    void leaveJournal() { options_.errorsGoToJournal = false; }

    /// Runs it to its end.
    AgentRun run(const std::vector<std::string>& arguments,
                 std::chrono::milliseconds limit = std::chrono::seconds(60)) const;

    /// Starts it.
    std::unique_ptr<RunningProgram> start(const std::vector<std::string>& arguments) const;

    /// Takes what a started one left behind, when it has ended.
    static AgentRun resultOf(const RunningProgram& program);

    /// The temporary files that its runs left lying about.
    std::vector<std::string> leftovers() const;

private:
    ProgramOptions options_;
    TemporaryFolder home_;
    TemporaryFolder temporary_;
};

/// Everything about the queues of a scheduler that a run of the agent must not change: attributes and PPDs.
std::string stateOfQueues(const PrivateScheduler& scheduler, const std::vector<std::string>& queues);

}  // namespace ventras
