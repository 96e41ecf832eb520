#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "devices/QueueRecord.h"
#include "drivers/PPDRecord.h"
#include "platform/QueueAttributes.h"

namespace ventras {

struct ImageDevice;

/// A device that was found, of any kind; each kind overrides what it can tell.
///
/// An operation's worker thread uses it during a round, the main thread afterwards; only queueID() may be
/// asked from several threads at once.
class VentrasPrinterObject {
public:
    virtual ~VentrasPrinterObject() = default;

    /// The device's display name, from which its queue is named.
    virtual std::optional<std::string> name() { return std::nullopt; }

    /// The device-ID text under which software for the device is asked for, and remembered as seen.
    virtual std::optional<std::string> softwareUpdateScanDeviceID() { return std::nullopt; }

    virtual bool supportsPCL() { return false; }
    virtual bool supportsPostscript() { return false; }

    /// The URI that a queue for this device carries as its device URI.
    virtual std::optional<std::string> deviceURI() { return std::nullopt; }

    /// Whether an image device is this same physical device.
    virtual bool matchesIDDevice(const ImageDevice&) { return false; }

    /// Name of an existing queue that already serves this device; some kinds give "" where they cannot tell.
    virtual std::optional<std::string> matchExistingQueues(const QueueRecords&) { return std::nullopt; }

    /// Attributes of the queue to be made with the driver chosen.
    virtual std::optional<QueueAttributes> driverInfo(const PPDRecord&) { return std::nullopt; }

    /// The drivers that fit, best first; absent for a device that no driver is looked for.
    virtual std::optional<std::vector<PPDRecord>> driverList() { return std::nullopt; }

    /// Why the device cannot be served, in words for the log; absent when nothing is known to be wrong with
    /// it.
    virtual std::optional<std::string> difficulty() { return std::nullopt; }

    /// Name of the queue that was made for this device, or found to serve it.
    std::optional<std::string> queueID() const;
    void setQueueID(std::optional<std::string> queueID);

private:
    mutable std::mutex mutex_;
    std::optional<std::string> queueID_;
};

using DevicePtr = std::shared_ptr<VentrasPrinterObject>;

}  // namespace ventras
