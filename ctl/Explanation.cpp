#include "ctl/Explanation.h"

#include <algorithm>
#include <optional>
#include <string>

#include "ctl/Evidence.h"
#include "ctl/PackageOffer.h"
#include "ctl/Records.h"
#include "ctl/Services.h"
#include "ctl/SilentOutput.h"
#include "ctl/Text.h"
#include "devices/VentrasPrinterObject.h"
#include "platform/PropertyList.h"
#include "platform/QueueAttributes.h"
#include "queues/QueueInventory.h"
#include "queues/QueueMaker.h"
#include "queues/QueueStatus.h"

namespace ventras {
namespace {

/// What would become of the device.
/// @param servingQueue the queue that serves it already
std::string outcomeOf(std::int32_t status, VentrasPrinterObject& device,
                      const std::optional<std::string>& servingQueue) {
    if (status == QueueStatus::kCreated)
        return "a queue would be made";
    if (status == QueueStatus::kAlreadyExists)
        return servingQueue == "" ? "nothing: it has no address by which to tell"
                                  : "nothing: a queue serves it";
    const auto reason = "no queue: " + QueueStatus::describe(status, device);
    return status == QueueStatus::kNoDriver ? reason + "; software for it would be looked for" : reason;
}

/// Why a queue is taken to serve a device.
Value reasonFor(const std::string& queueID, VentrasPrinterObject& device, const QueueRecords& queues) {
    const auto queue = std::ranges::find(queues, std::optional{queueID}, &QueueRecord::printerName);
    if (queue == queues.end())
        return "the device gives no address to compare";
    const auto uri = queue->deviceURI.value_or("");
    if (queue->deviceURI == device.deviceURI())
        return "its device URI is this device's: " + uri;
    return "its device URI belongs to the same device: " + uri;
}

Object objectOf(const PlannedQueue& queue) {
    const auto attributes = parsePropertyList(queue.attributes);
    const auto displayName = queue.options.find(std::string(QueueOptionKeys::kDisplayName));
    return {{"queueID", queue.queueID},
            {"displayName", displayName == queue.options.end() ? Value{} : Value{displayName->second}},
            {"attributes", attributes ? valueOf(*attributes) : Value{}}};
}

Array arrayOf(const std::vector<PlannedQueue>& queues) {
    Array array;
    for (const auto& queue : queues)
        array.emplace_back(objectOf(queue));
    return array;
}

std::string textUnder(const Value& object, std::string_view key) {
    const auto* member = find(std::get<Object>(object), key);
    return textOf(member == nullptr ? Value{} : *member);
}

std::string driverInShort(const Value& driver) {
    const auto* record = find(std::get<Object>(driver), "record");
    return textUnder(*record, "ppd_make_and_model") + " (" + textUnder(driver, "reason") + ")";
}

std::string queueInShort(const Value& queue) {
    return textUnder(queue, "queueID") + " (" + textUnder(queue, "displayName") + ")";
}

}  // namespace

Object explain(VentrasPrinterObject& device, Services& services) {
    const auto queues = QueueInventory(services.platform()).existingQueues().value_or(QueueRecords{});
    const auto evidence = evidenceOf(device);
    const auto drivers = driversFor(device);
    services.printSystem().takePlannedQueues();
    const auto status = [&] {
        const SilentOutput silent;
        return QueueMaker(services.platform(), services.drivers()).createQueueForDevice(device);
    }();
    const bool wantsPackage = status == QueueStatus::kNoDriver;
    const auto offer =
        wantsPackage ? installedPackageOffer(device.softwareUpdateScanDeviceID()) : PackageChoice{};
    const auto serving = status == QueueStatus::kAlreadyExists ? device.queueID() : std::nullopt;
    return {
        {"device", evidence.device},
        {"name", device.name()},
        {"deviceURI", device.deviceURI()},
        {"evidence", evidence.facts},
        {"queueID", serving},
        {"queueReason", serving ? reasonFor(*serving, device, queues) : Value{}},
        {"driverList", drivers},
        {"status", status},
        {"outcome", outcomeOf(status, device, serving)},
        {"difficulty", device.difficulty()},
        {"driverPackage", offer.package},
        {"packageReason", wantsPackage ? Value(offer.reason) : Value()},
        {"createQueue", arrayOf(services.printSystem().takePlannedQueues())},
    };
}

Object shortened(const Object& explanation) {
    Object lines = explanation;
    for (auto& [key, value] : lines)
        if (auto* array = std::get_if<Array>(&value))
            std::ranges::transform(*array, array->begin(),
                                   key == "driverList" ? driverInShort : queueInShort);
    return lines;
}

}  // namespace ventras
