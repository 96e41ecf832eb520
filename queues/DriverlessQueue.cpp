#include <algorithm>
#include <utility>

#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDManager.h"
#include "platform/ComputerName.h"
#include "platform/Platform.h"
#include "queues/QueueMaker.h"

namespace ventras {

std::int32_t QueueMaker::createQueue(VellumProfilePrinterObject& device) {
    const auto types = device.name() && device.urf() ? device.pdl() : std::nullopt;
    if (!types || !std::ranges::count(*types, "image/urf"))
        return QueueStatus::kCannotHandle;
    return createDriverlessQueue(device).status;
}

QueueMaker::DriverlessQueue QueueMaker::createDriverlessQueue(VentrasPrinterObject& device) {
    device.setQueueID(device.matchExistingQueues(inventory_.existingQueues().value_or(QueueRecords{})));
    if (device.queueID())
        return {QueueStatus::kAlreadyExists};

    const auto drivers = device.driverList();
    const auto ppdPath = drivers && !drivers->empty() ? drivers_.ppdFile(drivers->front()) : std::nullopt;
    if (!ppdPath)
        return {QueueStatus::kNoDriver};
    auto ppd = TemporaryFile::adopt(*ppdPath);

    const auto options =
        applyInstallableOptions(device.deviceURI().value_or(""), ppd.path(), Channel::Binary);
    if (options.status != 0)
        return {options.status};

    auto attributes = device.driverInfo(drivers->front()).value_or(QueueAttributes{});
    if (options.newPPD)
        attributes.insert_or_assign(std::string(QueueAttributeKeys::kPPD), options.newPPD->path());
    auto result =
        creation_.createQueue(platform_.computerName.computerName(), attributes, newDefaultPrinter(), device);
    if (result.status != QueueStatus::kCreated || !result.queueID || !device.name())
        return {result.status};
    device.setQueueID(std::move(result.queueID));
    return {result.status, std::move(attributes), std::move(ppd)};
}

}  // namespace ventras
