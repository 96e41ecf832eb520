#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <memory>
#include <mutex>
#include <set>
#include <stop_token>
#include <thread>
#include <vector>

#include "platform/Operation.h"

namespace ventras {

/// Runs operations on worker threads, each after its dependencies.
///
/// There are as many workers as operations are ready, up to kMostWorkers: they wait for networks, not for the
/// processor. Operations may be added from any thread. An exception that leaves an operation ends the
/// process.
class OperationQueue {
public:
    static constexpr std::size_t kMostWorkers = 64;

    OperationQueue() = default;
    OperationQueue(const OperationQueue&) = delete;
    OperationQueue& operator=(const OperationQueue&) = delete;

    /// Waits for the operations that are running; drops those that have not begun.
    ~OperationQueue();

    /// Queues an operation. A dependency that is never queued keeps it waiting for ever; an operation that a
    /// running one adds while the queue is being destroyed is dropped.
    void addOperation(std::shared_ptr<Operation> operation);

private:
    bool isReady(const Operation& operation) const;
    void promoteReadyOperations();
    void startWorkers();
    void work(const std::stop_token& stop);

    std::mutex mutex_;
    std::condition_variable_any changed_;
    std::deque<std::shared_ptr<Operation>> waiting_;
    std::deque<std::shared_ptr<Operation>> ready_;
    std::set<std::weak_ptr<Operation>, std::owner_less<>> finished_;
    std::size_t idleWorkers_ = 0;
    bool ending_ = false;
    std::vector<std::jthread> workers_;
};

}  // namespace ventras
