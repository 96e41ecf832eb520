#include "platform/OperationQueue.h"

#include <algorithm>
#include <utility>

namespace ventras {

OperationQueue::~OperationQueue() {
    {
        const std::lock_guard lock(mutex_);
        ending_ = true;
        waiting_.clear();
        ready_.clear();
    }
    for (auto& worker : workers_)
        worker.request_stop();
}

void OperationQueue::addOperation(std::shared_ptr<Operation> operation) {
    const std::lock_guard lock(mutex_);
    if (ending_)
        return;
    waiting_.push_back(std::move(operation));
    promoteReadyOperations();
}

bool OperationQueue::isReady(const Operation& operation) const {
    return std::ranges::all_of(operation.dependencies(),
                               [this](const auto& dependency) { return finished_.contains(dependency); });
}

void OperationQueue::promoteReadyOperations() {
    const auto firstReady = std::stable_partition(
        waiting_.begin(), waiting_.end(), [this](const auto& operation) { return !isReady(*operation); });
    std::move(firstReady, waiting_.end(), std::back_inserter(ready_));
    waiting_.erase(firstReady, waiting_.end());
    startWorkers();
}

void OperationQueue::startWorkers() {
    while (workers_.size() < kMostWorkers && idleWorkers_ < ready_.size()) {
        ++idleWorkers_;  // counted until it takes its first operation
        workers_.emplace_back([this](const std::stop_token& stop) { work(stop); });
    }
    changed_.notify_all();
}

void OperationQueue::work(const std::stop_token& stop) {
    std::unique_lock lock(mutex_);
    while (changed_.wait(lock, stop, [this] { return !ready_.empty(); })) {
        const auto operation = std::move(ready_.front());
        ready_.pop_front();
        --idleWorkers_;
        lock.unlock();
        operation->main();
        lock.lock();
        ++idleWorkers_;
        finished_.insert(operation);
        promoteReadyOperations();
    }
}

}  // namespace ventras
