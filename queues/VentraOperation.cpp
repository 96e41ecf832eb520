#include "queues/VentraOperation.h"

#include <string>
#include <utility>

#include "platform/Log.h"
#include "platform/Platform.h"
#include "platform/RunLoop.h"
#include "queues/OperationDelegate.h"
#include "queues/QueueMaker.h"

namespace ventras {

std::shared_ptr<VentraOperation> VentraOperation::operationWithDelegate(OperationDelegate& delegate,
                                                                        DevicePtr printer, Platform& platform,
                                                                        PPDManager& drivers) {
    return std::make_shared<VentraOperation>(delegate, std::move(printer), platform, drivers);
}

VentraOperation::VentraOperation(OperationDelegate& delegate, DevicePtr printer, Platform& platform,
                                 PPDManager& drivers)
    : delegate_(delegate), printer_(std::move(printer)), platform_(platform), drivers_(drivers) {}

void VentraOperation::main() {
    if (printer_) {
        status_ = QueueMaker(platform_, drivers_).createQueueForDevice(*printer_);
        if (!QueueStatus::isServed(status_))
            logFailure();
    }
    platform_.runLoop.performOnMainThread([this] { delegate_.operationCompleted(*this); });
}

void VentraOperation::logFailure() const {
    auto label = printer_->deviceURI().value_or("");
    if (label.empty())
        label = printer_->name().value_or("unknown device");
    platform_.log.error("No queue for " + label + ": " + QueueStatus::describe(status_, *printer_) + " (" +
                        std::to_string(status_) + ")");
}

}  // namespace ventras
