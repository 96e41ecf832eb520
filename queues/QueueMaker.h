#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "drivers/PPDRecord.h"
#include "platform/TemporaryFile.h"
#include "queues/QueueCreation.h"
#include "queues/QueueInventory.h"

namespace ventras {

class IPPUSBObject;
class PPDManager;
class ScannerObject;
class USBPrinterObject;
class VellumProfilePrinterObject;

/// What option selection gave.
struct InstallableOptions {
    std::int32_t status = 0;              ///< 0 = success, also when there was nothing to select
    std::optional<TemporaryFile> newPPD;  ///< to use in place of the old one; never there on failure
};

/// Whether the channel to a device passes every byte value.
enum class Channel { Binary, TextOnly };

/// Makes the queue, or the queues, for one device of any kind.
///
/// Several threads may each use their own; the print server is changed by one at a time. Calls block. Every
/// temporary file is gone when a call returns.
class QueueMaker {
public:
    QueueMaker(Platform& platform, PPDManager& drivers);

    /// @return a QueueStatus, or the status of option selection or of queue creation.
    std::int32_t createQueueForDevice(VentrasPrinterObject& device);

    /// Has the print system choose the installable options of this very device.
    InstallableOptions applyInstallableOptions(const std::string& deviceURI, const std::string& ppdPath,
                                               Channel channel);

    /// The first record that is installed, or can be, and is no fax driver: of a kind up to
    /// PPDKind::kInstalledHpijs. Absent when there is none, or no list.
    static std::optional<PPDRecord> firstPrinterDriver(const std::optional<std::vector<PPDRecord>>& drivers);

private:
    /// A driver for a USB printer, and what its channel passes.
    struct DriverChoice {
        PPDRecord driver;
        Channel channel;
    };

    std::int32_t createQueue(USBPrinterObject& printer);
    std::optional<DriverChoice> chooseUsbDriver(USBPrinterObject& printer);
    std::optional<DriverChoice> askForDriver(USBPrinterObject& printer);

    std::int32_t createQueue(ScannerObject& scanner);
    QueueCreationResult recordInPrinterQueue(ScannerObject& scanner);
    QueueCreationResult createScannerQueue(ScannerObject& scanner, const std::string& uri);

    /// What making a driverless printer's queue came to. The rest is there when the device got a new queue.
    struct DriverlessQueue {
        std::int32_t status = 0;
        QueueAttributes attributes = {};
        std::optional<TemporaryFile> ppd = {};  ///< the generic driver
    };

    std::int32_t createQueue(IPPUSBObject& printer);
    void createFaxQueue(IPPUSBObject& printer, QueueAttributes attributes, TemporaryFile ppd);

    std::int32_t createQueue(VellumProfilePrinterObject& device);
    DriverlessQueue createDriverlessQueue(VentrasPrinterObject& device);

    /// Whether the print system wants a new queue to become the default.
    DefaultPrinter newDefaultPrinter() const;

    Platform& platform_;
    PPDManager& drivers_;
    QueueInventory inventory_;
    QueueCreation creation_;
};

}  // namespace ventras
