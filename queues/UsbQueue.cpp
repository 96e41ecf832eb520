#include <optional>
#include <string>
#include <utility>

#include "deviceid/PMStringAdditions.h"
#include "devices/USBPrinterObject.h"
#include "drivers/PPDManager.h"
#include "platform/ComputerName.h"
#include "platform/Platform.h"
#include "platform/PrintSystemService.h"
#include "queues/QueueMaker.h"

namespace ventras {
namespace {

bool speaksPostscript(const USBPrinterObject& printer) {
    const auto deviceID = printer.deviceID().value_or("");
    const auto commandSet = PMStringAdditions::commandSet(deviceID);
    return commandSet && !commandSet->empty() && PMStringAdditions::supportsPostscript(deviceID);
}

}  // namespace

std::int32_t QueueMaker::createQueue(USBPrinterObject& printer) {
    if (auto existing = printer.matchExistingQueues(inventory_.existingQueues().value_or(QueueRecords{}))) {
        printer.setQueueID(std::move(existing));
        return QueueStatus::kAlreadyExists;
    }
    const auto choice = chooseUsbDriver(printer);
    const auto ppdPath = choice ? drivers_.ppdFile(choice->driver) : std::nullopt;
    if (!ppdPath)
        return QueueStatus::kNoDriver;
    const auto ppd = TemporaryFile::adopt(*ppdPath);

    // A printer that cannot tell its options still prints with the driver as it is.
    const auto options =
        applyInstallableOptions(printer.deviceURI().value_or(""), ppd.path(), choice->channel);
    auto attributes = printer.driverInfo(choice->driver).value_or(QueueAttributes{});
    attributes.insert_or_assign(std::string(QueueAttributeKeys::kPPD),
                                options.newPPD ? options.newPPD->path() : ppd.path());
    auto result = creation_.createQueue(platform_.computerName.computerName(), attributes,
                                        newDefaultPrinter(), printer);
    if (result.status == QueueStatus::kCreated && result.queueID)
        printer.setQueueID(std::move(result.queueID));
    return result.status;
}

std::optional<QueueMaker::DriverChoice> QueueMaker::chooseUsbDriver(USBPrinterObject& printer) {
    const bool isPostscript = speaksPostscript(printer);
    if (auto driver = firstPrinterDriver(printer.driverList()))
        return DriverChoice{std::move(*driver), isPostscript ? Channel::TextOnly : Channel::Binary};
    return isPostscript ? askForDriver(printer) : std::nullopt;
}

// A PostScript printer knows its own product name, which may name a driver that its device ID does not.
std::optional<QueueMaker::DriverChoice> QueueMaker::askForDriver(USBPrinterObject& printer) {
    const auto [status, context] =
        platform_.printSystem.autoSelectCreateContext(printer.deviceURI().value_or(""));
    if (status != 0 || context->autoSelectPPD() != 0)
        return std::nullopt;
    const auto info = context->autoSelectGetInfo();
    if (!info.product)
        return std::nullopt;
    auto driver = firstPrinterDriver(drivers_.matchPPDsByProduct(info.product));
    if (!driver)
        return std::nullopt;
    return DriverChoice{std::move(*driver), info.isBinaryOK ? Channel::Binary : Channel::TextOnly};
}

}  // namespace ventras
