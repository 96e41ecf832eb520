#include "agent/VentrasController.h"

#include <algorithm>
#include <utility>

#include "agent/InstallerSettings.h"
#include "agent/Request.h"
#include "deviceid/PMStringAdditions.h"
#include "devices/USBPrinterObject.h"
#include "download/DownloadTriggerOperation.h"
#include "platform/NotificationBroadcast.h"
#include "platform/Platform.h"
#include "platform/PrintToolAgentChannel.h"
#include "platform/RunLoop.h"
#include "queues/ScannerPPDRewrite.h"
#include "queues/VentraOperation.h"

namespace ventras {
namespace {

constexpr std::uint64_t kBrowsedDeviceTypes = ImageDeviceTypes::kScanners | ImageDeviceTypes::kReachable;
constexpr std::int64_t kNothingStarted = -1;
constexpr std::int64_t kSoftwareNotOffered = 1;
constexpr std::int64_t kUserCancelled = -128;

}  // namespace

VentrasController::VentrasController(Platform& platform, PPDManager& drivers)
    : platform_(platform),
      drivers_(drivers),
      seenPrinters_(platform.preferences),
      operationQueue_(std::in_place) {
    platform_.installer.setDelegate(this);
    platform_.installer.configure(installerSettings(platform_.strings, platform_.resources));
}

VentrasController::~VentrasController() {
    operationQueue_.reset();
    platform_.installer.setDelegate(nullptr);
}

std::int32_t VentrasController::run(std::span<const std::string> arguments) {
    const auto request = requestFromArguments(arguments, platform_, drivers_);
    downloadDrivers_ = request.downloadsDrivers;
    skerrow_ = request.skerrow;
    if (request.devices.empty())
        return static_cast<std::int32_t>(kNothingStarted);

    startDeviceBrowser(request);
    startRound(request.devices);
    return 0;
}

void VentrasController::startDeviceBrowser(const Request& request) {
    deviceBrowser_ = platform_.makeImageDeviceBrowser();
    deviceBrowser_->setDelegate(this);
    deviceBrowser_->setBrowsedDeviceTypeMask(kBrowsedDeviceTypes);
    if (request.namesIppUsbPrinter)
        deviceBrowser_->setBrowsedDeviceTypeMask(deviceBrowser_->browsedDeviceTypeMask() |
                                                 ImageDeviceTypes::kRegisteredHere);
    deviceBrowser_->start();
}

void VentrasController::startRound(std::span<const DevicePtr> devices) {
    roundIsRunning_ = true;
    downloadOperation_ = DownloadTriggerOperation::downloadTriggerOperationWithDelegate(*this, platform_);
    for (const auto& device : devices) {
        auto operation = VentraOperation::operationWithDelegate(*this, device, platform_, drivers_);
        downloadOperation_->addDependency(operation);
        operationQueue_->addOperation(std::move(operation));
    }
    operationQueue_->addOperation(downloadOperation_);
}

void VentrasController::operationCompleted(Operation& operation) {
    if (const auto* finished = dynamic_cast<const VentraOperation*>(&operation))
        queueOperationCompleted(*finished);
    else if (auto* download = dynamic_cast<DownloadTriggerOperation*>(&operation))
        downloadOperationCompleted(*download);
}

void VentrasController::queueOperationCompleted(const VentraOperation& operation) {
    const auto status = operation.status();
    if (status == QueueStatus::kNoDriver && downloadDrivers_) {
        if (!seenThisPrinter(*operation.printer()))
            downloadOperation_->addPrinterForSoftwareUpdate(operation.printer());
    } else if (QueueStatus::isServed(status)) {
        printersAdded_.insert(operation.printer());
    } else {
        exitStatus_ = static_cast<std::uint64_t>(std::int64_t{status});
    }
}

void VentrasController::downloadOperationCompleted(DownloadTriggerOperation& operation) {
    roundIsRunning_ = false;
    if (operation.printers().empty()) {
        terminateApplication(static_cast<std::int64_t>(exitStatus_));
        return;
    }
    std::vector<DevicePtr> offered;
    for (const auto& printer : operation.printers()) {
        setSeenThisPrinter(*printer);
        if (considerSoftwareFor(*printer))
            offered.push_back(printer);
    }
    operation.setPrinters(offered);
    if (!skerrow_ && !offered.empty())
        offerSoftware(offered);
    else
        terminateApplication(exitStatus_ != 0 ? static_cast<std::int64_t>(exitStatus_) : kSoftwareNotOffered);
}

bool VentrasController::considerSoftwareFor(VentrasPrinterObject& printer) {
    const auto scanID = printer.softwareUpdateScanDeviceID();
    if (!scanID)
        return false;
    const auto reply = platform_.printToolAgent.sendCommandSync(PrintToolAgentChannel::kService,
                                                                PrintToolAgentChannel::kCountDriverPackages,
                                                                {{PrintToolAgentKeys::kScanID, *scanID}});
    const auto count = packageCount(reply);
    const auto* usbPrinter = skerrow_ ? dynamic_cast<const USBPrinterObject*>(&printer) : nullptr;
    if (usbPrinter != nullptr) {
        platform_.notifications.post(
            "skerrowed-notification",
            {{"1284 DeviceID", usbPrinter->deviceID().value_or("")}, {"Match", count}});
        return false;
    }
    return count == 1 && !reply.dictionary.contains(PrintToolAgentKeys::kConflicts);
}

void VentrasController::offerSoftware(std::span<const DevicePtr> offered) {
    std::vector<std::string> scanIDs;
    PropertyArray manufacturers;
    for (const auto& printer : offered) {
        scanIDs.push_back(printer->softwareUpdateScanDeviceID().value_or(""));
        if (auto make = PMStringAdditions::make(scanIDs.back()))
            manufacturers.emplace_back(std::move(*make));
    }
    const auto predicate = DownloadTriggerOperation::predicateForUpdateStrings(scanIDs);
    if (!predicate) {
        terminateApplication(kNothingStarted);
        return;
    }
    platform_.installer.setTitle(promptTitle(platform_.strings, offered));
    platform_.installer.setInstalledPrintersList(
        {{InstalledPrintersKeys::kPrinters, PropertyArray(scanIDs.begin(), scanIDs.end())},
         {InstalledPrintersKeys::kManufacturers, std::move(manufacturers)}});
    constexpr bool kConfirmCompletion = false;
    platform_.installer.startWithPredicate(*predicate, kConfirmCompletion);
}

void VentrasController::terminateApplication(std::int64_t status) {
    exitStatus_ = static_cast<std::uint64_t>(status);
    notifyDriversInstalled();
    done_ = true;
    platform_.runLoop.stop();
}

void VentrasController::updateMFPs() {
    const auto imageDevices = deviceBrowser_ ? deviceBrowser_->devices() : std::vector<ImageDevice>{};
    for (const auto& printer : printersAdded_) {
        const auto scanner = std::ranges::find_if(
            imageDevices, [&](const ImageDevice& device) { return printer->matchesIDDevice(device); });
        if (scanner == imageDevices.end())
            continue;
        const auto uuid = scanner->uuidString.empty() ? std::nullopt : std::optional{scanner->uuidString};
        rewriteQueuePPDForScanner(platform_.printSystem, printer->queueID(), uuid, scanner->modulePath);
    }
}

void VentrasController::notifyDriversInstalled() {
    if (driversDownloaded_ && deviceBrowser_)
        deviceBrowser_->announceNewSoftwareInstalled();
}

// No install is under way while a round runs. An installer that says twice how it ended must not end the run
// then: the operations would wait for ever to report to a main thread that waits for them.
void VentrasController::predicateInstallDidComplete() {
    if (roundIsRunning_)
        return;
    const auto offered = downloadOperation_ ? downloadOperation_->printers() : std::vector<DevicePtr>{};
    if (offered.empty()) {
        terminateApplication(kNothingStarted);
        return;
    }
    startRound(offered);
    driversDownloaded_ = true;
}

void VentrasController::predicateInstallUserDidCancel() {
    if (!roundIsRunning_)
        terminateApplication(kUserCancelled);
}

void VentrasController::predicateInstallDidFailWithError(std::int64_t code) {
    if (!roundIsRunning_)
        terminateApplication(code);
}

}  // namespace ventras
