#pragma once

namespace ventras {

class Operation;

/// Hears of operations of a round as they finish.
class OperationDelegate {
public:
    virtual ~OperationDelegate() = default;

    /// Called on the main thread; the operation's worker waits until it returns.
    virtual void operationCompleted(Operation& operation) = 0;
};

}  // namespace ventras
