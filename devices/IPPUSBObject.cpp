#include "devices/IPPUSBObject.h"

#include <cups/cups.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"
#include "devices/TXTQuery.h"
#include "devices/TXTRecord.h"
#include "drivers/PPDManager.h"
#include "platform/ImageDeviceBrowser.h"

namespace ventras {
namespace {

constexpr const char* kUnknown = "Unknown";
constexpr const char* kNoSerialNumber = "(null)";  // queues made without a serial number carry it so
constexpr std::string_view kFaxResource = "ipp/faxout";

std::string assembled(const char* scheme, const std::string& host, const std::string& resource) {
    std::array<char, 1024> uri{};
    httpAssembleURI(HTTP_URI_CODING_ALL, uri.data(), static_cast<int>(uri.size()), scheme, nullptr,
                    host.c_str(), 0, resource.c_str());
    return uri.data();
}

// The number that a text begins with, blanks before it skipped; 0 when there is none.
std::int64_t decimalNumber(const std::optional<std::string>& text) {
    const auto digits = TextScan::trimmed(text ? *text : std::string_view{});
    std::int64_t number = 0;
    std::from_chars(digits.data(), digits.data() + digits.size(), number);
    return number;
}

bool isFaxQueue(const QueueRecord& queue) {
    return (queue.printerType.value_or(0) & CUPS_PRINTER_FAX) != 0;
}

bool isAnyQueue(const QueueRecord&) {
    return true;
}

std::optional<std::string> firstServing(const QueueRecords& queues, const std::vector<std::string>& uris,
                                        bool (*counts)(const QueueRecord&)) {
    if (uris.empty())
        return "";
    const auto serves = [&](const QueueRecord& queue) {
        return queue.deviceURI && std::ranges::find(uris, *queue.deviceURI) != uris.end() && counts(queue);
    };
    const auto serving = std::ranges::find_if(queues, serves);
    return serving == queues.end() ? std::nullopt : serving->printerName;
}

}  // namespace

IPPUSBObject::IPPUSBObject(PPDManager& drivers, std::string registeredName)
    : drivers_(drivers), registeredName_(std::move(registeredName)) {}

std::shared_ptr<IPPUSBObject> IPPUSBObject::ippUSBObjectWithRegisteredName(PPDManager& drivers,
                                                                           std::string registeredName) {
    return std::make_shared<IPPUSBObject>(drivers, std::move(registeredName));
}

std::string IPPUSBObject::registeredName() const {
    const std::lock_guard lock(nameMutex_);
    return registeredName_;
}

void IPPUSBObject::setRegisteredName(std::string registeredName) {
    const std::lock_guard lock(nameMutex_);
    registeredName_ = std::move(registeredName);
}

const std::optional<DeviceDescription>& IPPUSBObject::txtDictionary() {
    if (!txtDictionary_)
        txtDictionary_ = queryTXTRecord(registeredName());
    return txtDictionary_;
}

void IPPUSBObject::setTxtDictionary(std::optional<DeviceDescription> dictionary) {
    txtDictionary_ = std::move(dictionary);
}

std::optional<std::string> IPPUSBObject::txtValue(std::string_view key) {
    const auto& dictionary = txtDictionary();
    if (!dictionary)
        return std::nullopt;
    const auto found = dictionary->find(key);
    return found == dictionary->end() ? std::nullopt : std::optional{found->second};
}

std::optional<std::string> IPPUSBObject::trimmedValue(std::string_view key) {
    const auto value = txtValue(key);
    return value ? std::optional{std::string(TextScan::trimmed(*value))} : std::nullopt;
}

bool IPPUSBObject::hasTXTValues() {
    const auto& dictionary = txtDictionary();
    return dictionary && !dictionary->empty();
}

std::vector<std::string> IPPUSBObject::uris() {
    if (!hasTXTValues())
        return {};
    const auto model = trimmedValue("usb_MDL").value_or(kUnknown);
    const auto serialNumber = txtValue("usb_SN").value_or(kNoSerialNumber);
    return {
        assembled("usb", trimmedValue("usb_MFG").value_or(kUnknown), "/" + model + "?serial=" + serialNumber),
        deviceURI().value_or("")};
}

bool IPPUSBObject::supportsFax() {
    return txtValue("rfo") == kFaxResource;
}

std::optional<std::string> IPPUSBObject::name() {
    const bool knowsAnything = hasTXTValues();
    const auto make = knowsAnything ? trimmedValue("usb_MFG") : std::nullopt;
    const auto model = knowsAnything ? trimmedValue("usb_MDL") : std::nullopt;
    if (!model)
        return registeredName();
    return PMStringAdditions::deviceName(make ? "MFG:" + *make + ";MDL:" + *model : "MDL:" + *model);
}

std::optional<std::string> IPPUSBObject::deviceURI() {
    if (!hasTXTValues())
        return "";
    const auto host = registeredName() + "._ipp._tcp.local.";
    const auto uuid = txtValue("UUID");
    return assembled("ippusb", host, uuid ? "/?uuid=" + *uuid : "/");
}

bool IPPUSBObject::matchesIDDevice(const ImageDevice& device) {
    if (device.transport == ImageDeviceTransport::kUSB && txtValue("usb_SN") == device.serialNumber)
        return decimalNumber(txtValue("usb_PID")) == device.usbProduct &&
               decimalNumber(txtValue("usb_VID")) == device.usbVendor;
    if (device.transport != ImageDeviceTransport::kTCPIP)
        return false;
    const auto theirs = dictionaryFromTXTRecord(device.txtRecord);
    const auto uuid = theirs.find("UUID");
    return uuid != theirs.end() && txtValue("UUID") == uuid->second;
}

std::optional<std::string> IPPUSBObject::matchExistingQueues(const QueueRecords& queues) {
    return firstServing(queues, uris(), isAnyQueue);
}

std::optional<std::string> IPPUSBObject::matchExistingFaxQueue(const QueueRecords& queues) {
    return firstServing(queues, uris(), isFaxQueue);
}

std::optional<QueueAttributes> IPPUSBObject::driverInfo(const PPDRecord&) {
    if (!txtDictionary())
        return std::nullopt;
    // Make and model have changed places; queues have been described so ever since there are such printers.
    return QueueAttributes{
        {std::string(QueueAttributeKeys::kPrinterURI), deviceURI().value_or("")},
        {std::string(QueueAttributeKeys::kModel), trimmedValue("usb_MFG").value_or(kUnknown)},
        {std::string(QueueAttributeKeys::kManufacturer), trimmedValue("usb_MDL").value_or(kUnknown)}};
}

std::optional<std::vector<PPDRecord>> IPPUSBObject::driverList() {
    return std::vector{drivers_.genericURFPPD()};
}

std::optional<std::string> IPPUSBObject::difficulty() {
    if (hasTXTValues())
        return std::nullopt;
    return "no service of its name is registered in DNS-SD on this machine, or none that tells anything";
}

std::string IPPUSBObject::description() const {
    return "registeredName=" + registeredName();
}

}  // namespace ventras
