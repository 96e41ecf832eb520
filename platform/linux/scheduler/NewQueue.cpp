#include "platform/linux/scheduler/NewQueue.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <optional>
#include <string_view>

#include "platform/PropertyList.h"
#include "platform/QueueAttributes.h"
#include "platform/Utf8.h"
#include "platform/linux/scheduler/QueueName.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

constexpr std::size_t kLongestURI = 1023;  // RFC 8011 section 5.1.6
constexpr auto kNoDevice = "file:///dev/null"sv;

struct SchemeRow {
    std::string_view scheme;
    DriverKind driverKind;
};

// Every scheme that a queue is made for. A scanner's queue has one of the last two, or "usb".
constexpr std::array kSchemes{
    SchemeRow{"usb", DriverKind::Catalogue},    SchemeRow{"ipp", DriverKind::Driverless},
    SchemeRow{"ipps", DriverKind::Driverless},  SchemeRow{"ippusb", DriverKind::Driverless},
    SchemeRow{"mdns", DriverKind::ScannerOnly}, SchemeRow{"bluetooth", DriverKind::ScannerOnly},
};

std::optional<DriverKind> kindForDevice(std::string_view uri) {
    if (uri == kNoDevice)
        return DriverKind::ScannerOnly;
    const auto scheme = uri.substr(0, uri.find("://"));
    const auto row = std::ranges::find(kSchemes, scheme, &SchemeRow::scheme);
    return row == kSchemes.end() || scheme.size() == uri.size() ? std::nullopt
                                                                : std::optional{row->driverKind};
}

bool isClean(std::string_view text) {
    return isValidUtf8(text) && !hasControlCharacters(text);
}

std::string textUnder(const QueueAttributes& attributes, std::string_view key) {
    const auto* text = findText(attributes, key);
    return text == nullptr ? std::string() : *text;
}

bool isScannerQueue(const QueueAttributes& attributes) {
    const auto entry = attributes.find(QueueAttributeKeys::kScanner);
    const auto* flag = entry == attributes.end() ? nullptr : std::get_if<bool>(&entry->second);
    return flag != nullptr && *flag;
}

std::string shortened(std::string_view text) {
    return std::string(truncateUtf8(text, kLongestQueueText));
}

Refusal badData(std::string reason) {
    return {PrintSystemStatus::kBadData, std::move(reason)};
}

std::optional<Refusal> objectionTo(const NewQueue& queue) {
    if (!isQueueName(queue.queueID))
        return badData("no queue can have this name");
    if (!isClean(queue.deviceURI) || queue.deviceURI.size() > kLongestURI)
        return badData("the device URI is too long, or has characters that do not belong in one");
    if (!isClean(queue.location))
        return badData("the location holds control characters or is no UTF-8");
    if (!isClean(queue.displayName))
        return badData("the name for people holds control characters or is no UTF-8");
    if (!kindForDevice(queue.deviceURI))
        return badData("no queue is made for this kind of device URI");
    // What drives an IPP-over-USB printer is made from its own answer.
    if (queue.ppdPath.empty())
        return Refusal{PrintSystemStatus::kUnavailable,
                       "the printer did not tell what its driver has to know"};
    return std::nullopt;
}

}  // namespace

std::variant<NewQueue, Refusal> NewQueue::parse(const std::string& queueID, const std::string& attributes,
                                                const std::map<std::string, std::string>& options) {
    const auto list = parsePropertyList(attributes);
    const auto* dictionary = list ? std::get_if<PropertyDictionary>(&*list) : nullptr;
    if (dictionary == nullptr)
        return badData("the queue's attributes are no property list");

    NewQueue queue;
    queue.queueID = queueID;
    queue.deviceURI = textUnder(*dictionary, QueueAttributeKeys::kPrinterURI);
    queue.ppdPath = textUnder(*dictionary, QueueAttributeKeys::kPPD);
    queue.location = textUnder(*dictionary, QueueAttributeKeys::kLocation);
    if (const auto name = options.find(std::string(QueueOptionKeys::kDisplayName)); name != options.end())
        queue.displayName = name->second;
    if (auto refusal = objectionTo(queue))
        return *refusal;

    queue.location = shortened(queue.location);
    queue.displayName = shortened(queue.displayName);
    queue.driverKind =
        isScannerQueue(*dictionary) ? DriverKind::ScannerOnly : *kindForDevice(queue.deviceURI);
    return queue;
}

}  // namespace ventras
