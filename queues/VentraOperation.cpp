#include "queues/VentraOperation.h"

#include <algorithm>
#include <array>
#include <string>
#include <string_view>
#include <utility>

#include "platform/Log.h"
#include "platform/Platform.h"
#include "platform/PrintSystemService.h"
#include "platform/RunLoop.h"
#include "queues/OperationDelegate.h"
#include "queues/QueueMaker.h"

namespace ventras {
namespace {

struct Explanation {
    std::int32_t status;
    std::string_view text;
};

constexpr std::array kExplanations{
    Explanation{QueueStatus::kNoDriver, "no driver for it was found"},
    Explanation{QueueStatus::kCannotHandle, "it is of no kind that can be set up"},
    Explanation{QueueStatus::kCannotSerialize,
                "its description cannot be stored, or the print server has no address"},
    Explanation{QueueStatus::kNoIdentifier, "no queue name can be made of its name"},
    Explanation{PrintSystemStatus::kBadData, "its settings are not safe to use"},
    Explanation{PrintSystemStatus::kUnavailable, "the print scheduler, or the printer itself, does not answer"},
    Explanation{PrintSystemStatus::kCannotCreate, "the print scheduler refuses the queue"},
    Explanation{PrintSystemStatus::kNoPermission, "the print scheduler does not let this user make queues"},
};

std::string explanation(std::int32_t status) {
    const auto known = std::ranges::find(kExplanations, status, &Explanation::status);
    return known == kExplanations.end() ? "the print system's status" : std::string(known->text);
}

}  // namespace

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
        if (status_ != QueueStatus::kCreated && status_ != QueueStatus::kAlreadyExists)
            logFailure();
    }
    platform_.runLoop.performOnMainThread([this] { delegate_.operationCompleted(*this); });
}

void VentraOperation::logFailure() const {
    auto label = printer_->deviceURI().value_or("");
    if (label.empty())
        label = printer_->name().value_or("unknown device");
    const auto difficulty = status_ == QueueStatus::kCannotHandle ? printer_->difficulty() : std::nullopt;
    platform_.log.error("No queue for " + label + ": " + difficulty.value_or(explanation(status_)) + " (" +
                        std::to_string(status_) + ")");
}

}  // namespace ventras
