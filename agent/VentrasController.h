#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <set>
#include <span>
#include <string>
#include <vector>

#include "agent/SeenPrinters.h"
#include "devices/VentrasPrinterObject.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/OperationQueue.h"
#include "platform/PredicateInstallController.h"
#include "queues/OperationDelegate.h"

namespace ventras {

class DownloadTriggerOperation;
class PPDManager;
class VentraOperation;
struct Platform;
struct Request;

/// Runs rounds of queue making: turns the command line into devices, has an operation make the queue of each,
/// gathers what came of them, and offers driver packages for the devices left without a driver.
///
/// Main thread only; operations report to it there.
class VentrasController final : public OperationDelegate,
                                private PredicateInstallDelegate,
                                private ImageDeviceBrowser::Delegate {
public:
    VentrasController(Platform& platform, PPDManager& drivers);
    ~VentrasController() override;
    VentrasController(const VentrasController&) = delete;
    VentrasController& operator=(const VentrasController&) = delete;

    /// Starts a round for the arguments, the program's name not among them.
    /// @return 0 when it was started, -1 when the arguments yield no device.
    std::int32_t run(std::span<const std::string> arguments);

    /// Whether the agent is to stop.
    bool done() const { return done_; }

    /// The exit status; its low 32 bits are the process's.
    std::uint64_t exitStatus() const { return exitStatus_; }

    void operationCompleted(Operation& operation) override;

    /// Ends the run.
    void terminateApplication(std::int64_t status);

    /// Records in the queue of each printer that has one the identity of its scanner, where the image-capture
    /// system announced it. Called once, after the run loop has ended.
    void updateMFPs();

    bool seenThisPrinter(VentrasPrinterObject& printer) const { return seenPrinters_.contains(printer); }
    void setSeenThisPrinter(VentrasPrinterObject& printer) { seenPrinters_.insert(printer); }

private:
    void startDeviceBrowser(const Request& request);
    void startRound(std::span<const DevicePtr> devices);

    void queueOperationCompleted(const VentraOperation& operation);
    void downloadOperationCompleted(DownloadTriggerOperation& operation);

    /// Asks whether there is one package for the printer; announces a USB printer in skerrow mode instead.
    /// @return whether to offer it.
    bool considerSoftwareFor(VentrasPrinterObject& printer);
    void offerSoftware(std::span<const DevicePtr> offered);
    void notifyDriversInstalled();

    void predicateInstallDidComplete() override;
    void predicateInstallUserDidCancel() override;
    void predicateInstallDidFailWithError(std::int64_t code) override;

    void deviceAdded(const ImageDevice&) override {}
    void deviceRemoved(const ImageDevice&) override {}

    // Members go in the opposite order: the workers first, then what their operations use.
    Platform& platform_;
    PPDManager& drivers_;
    std::unique_ptr<ImageDeviceBrowser> deviceBrowser_;
    std::set<DevicePtr> printersAdded_;
    SeenPrinters seenPrinters_;
    std::shared_ptr<DownloadTriggerOperation> downloadOperation_;
    std::uint64_t exitStatus_ = 0;
    bool done_ = false;
    bool roundIsRunning_ = false;
    bool downloadDrivers_ = true;
    bool driversDownloaded_ = false;
    bool skerrow_ = false;
    std::optional<OperationQueue> operationQueue_;
};

}  // namespace ventras
