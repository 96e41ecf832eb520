#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "deviceid/PMDictionaryAdditions.h"
#include "devices/VentrasPrinterObject.h"

namespace ventras {

class PPDManager;

/// A USB printer that speaks IPP over USB (IPP-USB 1.0) and is registered in DNS-SD on this machine under a
/// name.
///
/// All that is known of it is its TXT record, which it asks the responder for whenever it is needed and not
/// there yet. One thread at a time; only registeredName() may be asked and set from several threads at once.
class IPPUSBObject final : public VentrasPrinterObject {
public:
    IPPUSBObject(PPDManager& drivers, std::string registeredName);

    static std::shared_ptr<IPPUSBObject> ippUSBObjectWithRegisteredName(PPDManager& drivers,
                                                                        std::string registeredName);

    /// The DNS-SD service instance name.
    std::string registeredName() const;
    void setRegisteredName(std::string registeredName);

    /// The TXT record; blocks for up to 3 seconds while there is none. Absent when nobody answers.
    const std::optional<DeviceDescription>& txtDictionary();
    void setTxtDictionary(std::optional<DeviceDescription> dictionary);

    /// The URIs that a queue for this printer may carry: by its USB identity, and deviceURI(). Empty without
    /// a TXT record.
    std::vector<std::string> uris();

    /// Whether the printer has a fax service at the usual resource.
    bool supportsFax();

    /// Make and model; the registered name when the TXT record tells no model.
    std::optional<std::string> name() override;

    /// "ippusb://NAME._ipp._tcp.local./?uuid=UUID"; "" without a TXT record.
    std::optional<std::string> deviceURI() override;

    bool matchesIDDevice(const ImageDevice& device) override;

    /// The first queue for one of uris(), fax queues included; "" without a TXT record.
    std::optional<std::string> matchExistingQueues(const QueueRecords& queues) override;

    /// The first fax queue for one of uris(); "" without a TXT record.
    std::optional<std::string> matchExistingFaxQueue(const QueueRecords& queues);

    std::optional<QueueAttributes> driverInfo(const PPDRecord& driver) override;
    std::optional<std::vector<PPDRecord>> driverList() override;
    std::optional<std::string> difficulty() override;

    /// For log lines.
    std::string description() const;

private:
    std::optional<std::string> txtValue(std::string_view key);
    std::optional<std::string> trimmedValue(std::string_view key);
    bool hasTXTValues();

    PPDManager& drivers_;
    mutable std::mutex nameMutex_;
    std::string registeredName_;
    std::optional<DeviceDescription> txtDictionary_;
};

}  // namespace ventras
