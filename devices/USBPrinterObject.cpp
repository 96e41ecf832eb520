#include "devices/USBPrinterObject.h"

#include <cups/http.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"
#include "drivers/PPDManager.h"
#include "platform/FileContent.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/Platform.h"
#include "platform/PropertyList.h"
#include "platform/ResourceBundle.h"

namespace ventras {
namespace {

constexpr const char* kUnknown = "Unknown";

std::string hexadecimal(std::uint32_t number) {
    std::array<char, 8> digits{};
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), number, 16).ptr;
    return {digits.data(), end};
}

std::string trimmedOrUnknown(const std::optional<std::string>& text) {
    return text ? std::string(TextScan::trimmed(*text)) : kUnknown;
}

}  // namespace

USBPrinterObject::USBPrinterObject(Platform& platform, PPDManager& drivers, std::uint32_t location,
                                   std::uint8_t interfaceNumber, std::uint16_t vendorID,
                                   std::uint16_t productID, std::optional<std::string> deviceID)
    : platform_(platform),
      drivers_(drivers),
      location_(location),
      interfaceNumber_(interfaceNumber),
      vendorID_(vendorID),
      productID_(productID),
      deviceID_(std::move(deviceID)) {}

std::shared_ptr<USBPrinterObject> USBPrinterObject::usbPrinterObjectWithLocation(
    Platform& platform, PPDManager& drivers, std::uint32_t location, std::uint8_t interfaceNumber,
    std::uint16_t vendorID, std::uint16_t productID, std::optional<std::string> deviceID) {
    return std::make_shared<USBPrinterObject>(platform, drivers, location, interfaceNumber, vendorID,
                                              productID, std::move(deviceID));
}

std::optional<std::string> USBPrinterObject::make() const {
    return PMStringAdditions::make(idText());
}

std::optional<std::string> USBPrinterObject::model() const {
    return PMStringAdditions::model(idText());
}

std::optional<std::string> USBPrinterObject::serialNumber() const {
    return PMStringAdditions::serialNumber(idText());
}

std::optional<std::string> USBPrinterObject::name() {
    return PMStringAdditions::deviceName(idText());
}

std::optional<std::string> USBPrinterObject::softwareUpdateScanDeviceID() {
    return PMStringAdditions::softwareUpdateScaneID(idText());
}

bool USBPrinterObject::supportsPCL() {
    return PMStringAdditions::supportsPCL(idText());
}

bool USBPrinterObject::supportsPostscript() {
    return PMStringAdditions::supportsPostscript(idText());
}

std::optional<std::string> USBPrinterObject::deviceURI() {
    const auto host = trimmedOrUnknown(make());
    const auto model = trimmedOrUnknown(this->model());
    std::array<char, 1024> uri{};
    const auto assemble = [&](const char* format, const auto&... values) {
        httpAssembleURIf(HTTP_URI_CODING_ALL, uri.data(), static_cast<int>(uri.size()), "usb", nullptr,
                         host.c_str(), 0, format, model.c_str(), values.c_str()...);
    };
    if (const auto serial = serialNumber())
        assemble("/%s?serial=%s", *serial);
    else if (location_ != kNoLocation)
        assemble("/%s?location=%s", hexadecimal(location_));
    else
        assemble("/%s");
    return uri.data();
}

bool USBPrinterObject::matchesIDDevice(const ImageDevice& device) {
    return device.transport == ImageDeviceTransport::kUSB && device.usbLocation == location_ &&
           device.usbProduct == productID_ && device.usbVendor == vendorID_;
}

std::optional<std::string> USBPrinterObject::matchExistingQueues(const QueueRecords& queues) {
    const auto uri = deviceURI().value_or("");
    const auto colon = uri.find(':');
    // An empty tail would end every queue's URI.
    if (colon == std::string::npos)
        return std::nullopt;
    const auto tail = std::string_view(uri).substr(colon);
    const auto serves = [tail](const QueueRecord& queue) {
        return queue.deviceURI && queue.deviceURI->starts_with("usb://") && queue.deviceURI->ends_with(tail);
    };
    const auto serving = std::ranges::find_if(queues, serves);
    return serving == queues.end() ? std::nullopt : serving->printerName;
}

std::optional<std::vector<PPDRecord>> USBPrinterObject::driverList() {
    return drivers_.matchPPDsByDeviceID(deviceID_, model(), PMStringAdditions::product(idText()));
}

std::optional<QueueAttributes> USBPrinterObject::driverInfo(const PPDRecord&) {
    QueueAttributes info;
    const auto set = [&info](std::string_view key, std::string value) {
        info.insert_or_assign(std::string(key), std::move(value));
    };
    set(QueueAttributeKeys::kPrinterURI, deviceURI().value_or(""));
    set(QueueAttributeKeys::kModel, model().value_or(kUnknown));
    set(QueueAttributeKeys::kManufacturer, make().value_or(kUnknown));
    // Unlike the device URI, this leaves out a location of 0 and keeps an unknown one.
    if (location_ != 0)
        set(QueueAttributeKeys::kUSBAddressLocationID, hexadecimal(location_));
    if (const auto serial = serialNumber(); serial && mayUseSerialNumber())
        set(QueueAttributeKeys::kSerialNumber, *serial);
    return info;
}

/// Some makers gave one serial number to a whole series; those devices are on a list.
bool USBPrinterObject::mayUseSerialNumber() const {
    const auto path = platform_.resources.pathForResource("NoSerialNumber", "xml");
    const auto text = path ? fileContent(*path) : std::nullopt;
    const auto list = text ? parsePropertyList(*text) : std::nullopt;
    const auto* devices = list ? std::get_if<PropertyDictionary>(&*list) : nullptr;
    return devices == nullptr ||
           !devices->contains(std::to_string(vendorID_) + "/" + std::to_string(productID_));
}

std::string USBPrinterObject::description() const {
    return "loc:0x" + hexadecimal(location_) + " intf:" + std::to_string(interfaceNumber_) +
           " vendor:" + std::to_string(vendorID_) + " prod:" + std::to_string(productID_) +
           " id:" + deviceID_.value_or("(null)");
}

}  // namespace ventras
