#pragma once

#include <memory>
#include <vector>

namespace ventras {

/// A piece of work for an OperationQueue.
class Operation {
public:
    virtual ~Operation() = default;

    /// The work itself; runs once, on one of the queue's worker threads.
    virtual void main() = 0;

    /// Makes this operation wait until `operation` has finished. Call it before this operation is queued.
    void addDependency(std::shared_ptr<Operation> operation) {
        dependencies_.push_back(std::move(operation));
    }

    const std::vector<std::shared_ptr<Operation>>& dependencies() const { return dependencies_; }

private:
    std::vector<std::shared_ptr<Operation>> dependencies_;
};

}  // namespace ventras
