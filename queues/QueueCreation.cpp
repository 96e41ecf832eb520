#include "queues/QueueCreation.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <mutex>
#include <utility>

#include "devices/VentrasPrinterObject.h"
#include "platform/Platform.h"
#include "platform/PrintSystemService.h"
#include "platform/PropertyList.h"
#include "platform/Utf8.h"
#include "queues/QueueInventory.h"
#include "queues/QueueLock.h"
#include "queues/QueueNaming.h"

namespace ventras {
namespace {

constexpr std::size_t kLongestGuardName = 1024;  // bytes, with the final NUL

// Holds off other processes that are making a queue for the same USB device. The file is gone at once; what
// counts is the moment of its exclusive creation.
class UsbGuard {
public:
    explicit UsbGuard(const std::string& deviceURI) {
        std::string path = "/tmp/" + deviceURI;
        std::replace_if(
            path.begin() + 5, path.end(), [](char c) { return c == '/' || c == '?'; }, '.');
        if (!isValidUtf8(path) || path.size() >= kLongestGuardName)
            return;
        descriptor_ = open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        isHeldByOther_ = descriptor_ < 0;
        if (!isHeldByOther_)
            unlink(path.c_str());
    }
    ~UsbGuard() {
        if (descriptor_ >= 0)
            close(descriptor_);
    }
    UsbGuard(const UsbGuard&) = delete;
    UsbGuard& operator=(const UsbGuard&) = delete;

    bool isHeldByOther() const { return isHeldByOther_; }
    bool isTaken() const { return descriptor_ >= 0; }

private:
    int descriptor_ = -1;
    bool isHeldByOther_ = false;
};

}  // namespace

QueueCreation::QueueCreation(Platform& platform, const QueueInventory& inventory)
    : platform_(platform), inventory_(inventory) {}

QueueCreationResult QueueCreation::createQueue(const std::optional<std::string>& location,
                                               const QueueAttributes& attributes,
                                               DefaultPrinter defaultPrinter,
                                               VentrasPrinterObject& device) const {
    QueueCreationResult existing{QueueStatus::kAlreadyExists, std::nullopt};
    bool proceeds = true;
    std::optional<UsbGuard> guard;
    const auto* deviceURI = findText(attributes, QueueAttributeKeys::kPrinterURI);
    if (deviceURI != nullptr && deviceURI->starts_with("usb://")) {
        guard.emplace(*deviceURI);
        if (guard->isTaken())
            existing.queueID = inventory_.findQueueByDeviceURI(*deviceURI);
        proceeds = !guard->isHeldByOther() && !existing.queueID;
    }

    const std::lock_guard lock(queueLock());
    const auto deviceName = device.name();
    const auto displayName =
        suggestedDisplayName(platform_.printSystem, deviceName ? stripBracketedTag(*deviceName) : "Unknown");
    if (!proceeds)
        return existing;
    QueueAttributes complete = attributes;
    if (location)
        complete.insert_or_assign(std::string(QueueAttributeKeys::kLocation), *location);
    return createUnderLock(complete, displayName, defaultPrinter);
}

QueueCreationResult QueueCreation::createUnderLock(const QueueAttributes& attributes,
                                                   const std::string& displayName,
                                                   DefaultPrinter defaultPrinter) const {
    auto& printSystem = platform_.printSystem;
    const auto serialized = xmlPropertyList(attributes);
    const auto server = printSystem.copyLocalServerURL();
    if (!serialized || !server)
        return {QueueStatus::kCannotSerialize, std::nullopt};
    auto queueID = printSystem.suggestQueueName(displayName, true);
    if (!queueID)
        return {QueueStatus::kNoIdentifier, std::nullopt};

    const auto status = printSystem.createQueue(*server, *queueID, *serialized,
                                                {{std::string(QueueOptionKeys::kDisplayName), displayName}});
    if (status != 0) {
        printSystem.removeQueue(*queueID);
        return {status, std::nullopt};
    }
    std::printf("Queue ID:%s\n", queueID->c_str());
    if (defaultPrinter == DefaultPrinter::BecomesNewQueue && !printSystem.isFax(*queueID) &&
        !printSystem.isScanner(*queueID))
        printSystem.setDefaultPrinter(*queueID);
    return {QueueStatus::kCreated, std::move(queueID)};
}

}  // namespace ventras
