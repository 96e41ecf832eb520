#include "queues/QueueInventory.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "platform/FileContent.h"
#include "platform/IppConnection.h"
#include "platform/Platform.h"
#include "platform/ProcessTable.h"
#include "platform/PropertyList.h"

namespace ventras {
namespace {

using namespace std::literals;

// "sockt:" is how the list has always been spelt; queues of "socket" devices stay out of the inventory.
constexpr std::array kSchemes{"usb:"sv, "mdns:"sv,  "dnssd:"sv,  "ipp:"sv,   "ipps:"sv,
                              "lpd:"sv, "sockt:"sv, "ippusb:"sv, "riousb:"sv};

constexpr std::string_view kName = "printer-name";
constexpr std::string_view kDeviceURI = "device-uri";
constexpr std::string_view kType = "printer-type";

bool isSchedulerRunning(ProcessTable& processes) {
    return processes.processNamed("cupsd").value_or(0) != 0;
}

QueueRecord recordFrom(const PropertyDictionary& entry) {
    QueueRecord record;
    if (const auto* name = findText(entry, kName))
        record.printerName = *name;
    if (const auto* uri = findText(entry, kDeviceURI))
        record.deviceURI = *uri;
    if (const auto type = entry.find(kType); type != entry.end())
        if (const auto* bits = std::get_if<std::int64_t>(&type->second))
            record.printerType = *bits;
    return record;
}

// Absent when the file is missing or is no list.
std::optional<QueueRecords> savedQueues(const std::filesystem::path& path) {
    const auto text = fileContent(path);
    const auto list = text ? parsePropertyList(*text) : std::nullopt;
    const auto* entries = list ? std::get_if<PropertyArray>(&*list) : nullptr;
    if (entries == nullptr)
        return std::nullopt;
    QueueRecords queues;
    for (const auto& entry : *entries)
        if (const auto* dictionary = std::get_if<PropertyDictionary>(&entry))
            queues.push_back(recordFrom(*dictionary));
    return queues;
}

IppPtr queuesRequest() {
    constexpr std::array kRequested{kName.data(), kDeviceURI.data(), kType.data()};
    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PRINTERS)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/");
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                  static_cast<int>(kRequested.size()), nullptr, kRequested.data());
    ippAddInteger(request.get(), IPP_TAG_OPERATION, IPP_TAG_ENUM, "printer-type", 0);
    return request;
}

void readInto(QueueRecord& record, ipp_attribute_t* attribute) {
    const std::string_view name = ippGetName(attribute);
    const ipp_tag_t tag = ippGetValueTag(attribute);
    if (name == kName && tag == IPP_TAG_NAME)
        record.printerName = ippGetString(attribute, 0, nullptr);
    else if (name == kDeviceURI && tag == IPP_TAG_URI)
        record.deviceURI = ippGetString(attribute, 0, nullptr);
    else if (name == kType && tag == IPP_TAG_ENUM)
        record.printerType = ippGetInteger(attribute, 0);
}

bool isKept(const QueueRecord& record) {
    return record.printerName && record.printerType && record.deviceURI &&
           std::ranges::any_of(
               kSchemes, [&](std::string_view scheme) { return record.deviceURI->starts_with(scheme); });
}

// Each run of attributes of the printer group is one queue.
QueueRecords queuesIn(ipp_t* response) {
    QueueRecords queues;
    QueueRecord record;
    const auto endRun = [&] {
        if (isKept(record))
            queues.push_back(record);
        record = {};
    };
    for (auto* attribute = ippFirstAttribute(response); attribute != nullptr;
         attribute = ippNextAttribute(response)) {
        if (ippGetGroupTag(attribute) == IPP_TAG_PRINTER && ippGetName(attribute) != nullptr)
            readInto(record, attribute);
        else
            endRun();
    }
    endRun();
    return queues;
}

std::optional<QueueRecords> nonEmpty(QueueRecords queues) {
    return queues.empty() ? std::nullopt : std::optional{std::move(queues)};
}

}  // namespace

QueueInventory::QueueInventory(Platform& platform, std::filesystem::path savedList)
    : platform_(platform), savedList_(std::move(savedList)) {}

std::optional<QueueRecords> QueueInventory::existingQueues() const {
    if (!isSchedulerRunning(platform_.processes))
        if (auto saved = savedQueues(savedList_))
            return nonEmpty(std::move(*saved));

    const auto answer = IppConnection::toScheduler().exchange(queuesRequest(), "/printers");
    return answer.response ? nonEmpty(queuesIn(answer.response.get())) : std::nullopt;
}

std::optional<std::string> QueueInventory::findQueueByDeviceURI(const std::string& deviceURI) const {
    const auto queues = existingQueues();
    if (!queues)
        return std::nullopt;
    const auto queue = std::ranges::find(*queues, std::optional{deviceURI}, &QueueRecord::deviceURI);
    return queue == queues->end() ? std::nullopt : std::optional{queue->printerName.value_or("")};
}

}  // namespace ventras
