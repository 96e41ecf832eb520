#pragma once

#include <cstdint>
#include <memory>

#include "devices/VentrasPrinterObject.h"
#include "platform/Operation.h"
#include "queues/QueueStatus.h"

namespace ventras {

class OperationDelegate;
class PPDManager;
struct Platform;

/// Makes the queue, or the queues, for one device. The status is set by the worker thread before the delegate
/// hears of it, and constant afterwards.
class VentraOperation final : public Operation {
public:
    static std::shared_ptr<VentraOperation> operationWithDelegate(OperationDelegate& delegate,
                                                                  DevicePtr printer, Platform& platform,
                                                                  PPDManager& drivers);

    /// @param delegate not owned; outlives the operation
    /// @param printer may be empty: the operation then reports that there is no device
    VentraOperation(OperationDelegate& delegate, DevicePtr printer, Platform& platform, PPDManager& drivers);

    void main() override;

    const DevicePtr& printer() const { return printer_; }

    /// A QueueStatus, or the print system's; kNoDevice until the work is done.
    std::int32_t status() const { return status_; }

private:
    void logFailure() const;

    OperationDelegate& delegate_;
    DevicePtr printer_;
    Platform& platform_;
    PPDManager& drivers_;
    std::int32_t status_ = QueueStatus::kNoDevice;
};

}  // namespace ventras
