#pragma once

#include <string>
#include <vector>

#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// Where all rounds take place: a scheduler with a driver and with a queue of somebody else's. One thread at
/// a time.
class Workshop {
public:
    static constexpr const char* kPresent = "Present";

    Workshop();
    Workshop(const Workshop&) = delete;
    Workshop& operator=(const Workshop&) = delete;
    ~Workshop();

    PrivateScheduler& scheduler() { return scheduler_; }

    /// The scheduler's, for the agent.
    Environment environment() const { return scheduler_.environment(); }

    /// Has the scheduler write its queues down, as it does when it ends; one that is killed has only these.
    void saveQueues();

    /// The queues that are not somebody else's.
    std::vector<std::string> newQueues() const;

    /// Temporary files that this process has left; folders are the parts' own.
    std::vector<std::string> leftovers() const;

private:
    TemporaryFolder temporary_;
    PrivateScheduler scheduler_{{.models = {{}}}};
    UseScheduler use_{scheduler_};
};

}  // namespace ventras
