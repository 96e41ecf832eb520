#pragma once

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "devices/VentrasPrinterObject.h"
#include "platform/Operation.h"

namespace ventras {

class OperationDelegate;
struct Platform;

/// Runs after all queue operations of a round, with the devices that found no driver. Its own work is to
/// report. The list of devices belongs to the main thread.
class DownloadTriggerOperation final : public Operation {
public:
    static std::shared_ptr<DownloadTriggerOperation> downloadTriggerOperationWithDelegate(
        OperationDelegate& delegate, Platform& platform);

    /// @param delegate not owned; outlives the operation
    DownloadTriggerOperation(OperationDelegate& delegate, Platform& platform);

    void main() override;

    /// Devices waiting for printer software; after the controller's choice, those that are offered.
    const std::vector<DevicePtr>& printers() const { return printers_; }
    void setPrinters(std::vector<DevicePtr> printers) { printers_ = std::move(printers); }
    void addPrinterForSoftwareUpdate(DevicePtr printer) { printers_.push_back(std::move(printer)); }

    /// The predicate, as text, of the software-update packages whose tags name a device.
    /// An ID goes into the text as it stands: a quotation mark in it changes what the parser reads.
    /// @param scanID from softwareUpdateScanDeviceID()
    /// @return absent for an empty ID.
    static std::optional<std::string> predicateForUpdateString(const std::string& scanID);

    /// The same for any of several devices; empty IDs are left out. @return absent when none is left.
    static std::optional<std::string> predicateForUpdateStrings(std::span<const std::string> scanIDs);

private:
    OperationDelegate& delegate_;
    Platform& platform_;
    std::vector<DevicePtr> printers_;
};

}  // namespace ventras
