#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

#include "platform/TemporaryFile.h"
#include "platform/linux/scheduler/NewQueue.h"
#include "platform/linux/scheduler/QueueName.h"
#include "platform/linux/scheduler/SchedulerRequest.h"

namespace ventras {

/// What the scheduler says about one of its queues.
struct QueueState {
    std::string deviceURI;
    std::string makeAndModel;
    std::uint32_t type = 0;  ///< bits of cups_ptype_t
    ipp_pstate_t state = IPP_PSTATE_STOPPED;
    bool accepting = false;

    bool isFax() const { return (type & CUPS_PRINTER_FAX) != 0; }
};

/// One connection to the scheduler of the user's libcups configuration, and the requests that we make over
/// it. Every function waits for its answer, within IppConnection's limits. Use it on one thread.
class Scheduler {
public:
    Scheduler() : connection_(IppConnection::toScheduler()) {}

    /// The names of all destinations, classes included.
    std::variant<QueueNames, Refusal> queueNames();

    /// @return absent when there is no such queue.
    std::variant<std::optional<QueueState>, Refusal> queueState(const std::string& queueID);

    /// Makes an idle queue that accepts jobs, or changes the one that has the name.
    /// @param ppd descriptor of the driver's file
    std::optional<Refusal> addQueue(const NewQueue& queue, int ppd);

    std::optional<Refusal> replacePPD(const std::string& queueID, int ppd);
    std::optional<Refusal> deleteQueue(const std::string& queueID);
    std::optional<Refusal> setDefaultQueue(const std::string& queueID);

    /// A copy of a queue's PPD as the scheduler has it. libcups' own call may hand out a link to a file of
    /// another scheduler's, when it runs on the same machine and has a queue of that name.
    std::variant<TemporaryFile, Refusal> fetchPPD(const std::string& queueID);

    /// Whether some destination is the default one.
    std::variant<bool, Refusal> hasDefaultQueue();

private:
    IppConnection connection_;
};

}  // namespace ventras
