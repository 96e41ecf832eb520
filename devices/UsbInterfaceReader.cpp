#include "devices/UsbInterfaceReader.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <span>
#include <string_view>
#include <vector>

#include "deviceid/PMStringAdditions.h"
#include "platform/Utf8.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr auto kPatient = 5000ms;
constexpr auto kQuick = 60ms;

constexpr std::uint8_t kGetDescriptor = 6;
constexpr std::uint16_t kDeviceDescriptor = 0x0100;
constexpr std::uint16_t kStringDescriptors = 0x0300;
constexpr std::uint8_t kStringDescriptorType = 3;
constexpr std::uint16_t kUSEnglish = 0x0409;
constexpr std::size_t kDeviceDescriptorLength = 18;
constexpr std::size_t kIManufacturer = 14;
constexpr std::size_t kIProduct = 15;
constexpr std::size_t kISerialNumber = 16;

UsbControlRequest descriptorRequest(std::uint16_t descriptor, std::uint16_t language, std::size_t length,
                                    std::chrono::milliseconds noDataTimeOut) {
    UsbControlRequest request;
    request.bmRequestType = 0x80;
    request.bRequest = kGetDescriptor;
    request.wValue = descriptor;
    request.wIndex = language;
    request.wLength = static_cast<std::uint16_t>(length);
    request.noDataTimeOut = noDataTimeOut;
    return request;
}

/// What really came, however long the device says it is.
std::span<const std::uint8_t> received(const UsbControlRequest& request) {
    return std::span(request.data)
        .first(std::min<std::size_t>(request.bytesTransferred, request.data.size()));
}

std::optional<std::string> utf8(std::string text) {
    // NUL is a character of UTF-8 like any other, and some printers pad with it.
    std::string_view rest = text;
    for (;;) {
        const auto nul = rest.find('\0');
        if (!isValidUtf8(rest.substr(0, nul)))
            return std::nullopt;
        if (nul == std::string_view::npos)
            return text;
        rest.remove_prefix(nul + 1);
    }
}

/// The text of an ID reply of which `length` bytes count, the two length bytes among them.
std::optional<std::string> idText(const UsbControlRequest& reply, std::size_t length) {
    const auto bytes = received(reply);
    length = std::min(length, bytes.size());
    if (length <= 2)
        return std::nullopt;
    const auto id = bytes.first(length).subspan(2);
    return utf8({id.begin(), id.end()});
}

void appendEntry(std::string& text, std::string_view key, const std::optional<std::string>& value) {
    if (value && !value->empty())
        text.append(key).append(*value).append(";");
}

/// Takes every "+" out of the serial number where it first stands in the ID; device URIs do not bring it
/// back.
void removePlusFromSerialNumber(std::string& deviceID, const std::string& serialNumber) {
    const auto start = deviceID.find(serialNumber);
    if (start == std::string::npos || serialNumber.find('+') == std::string::npos)
        return;
    std::string clean = serialNumber;
    std::erase(clean, '+');
    deviceID.replace(start, serialNumber.size(), clean);
}

std::string hexadecimal(std::span<const std::uint8_t> bytes) {
    constexpr std::string_view kDigits = "0123456789ABCDEF";
    std::string text;
    for (const auto byte : bytes) {
        if (!text.empty())
            text += '-';
        text += kDigits[byte >> 4U];
        text += kDigits[byte & 15U];
    }
    return text;
}

void appendIPPOverUSBEntries(UsbRegistry& registry, const UsbInterfaceHandle& interface,
                             std::vector<std::string>& entries) {
    const std::uint8_t interfaceClass = registry.interfaceClass(interface).value_or(0);
    const std::uint8_t subClass = registry.interfaceSubClass(interface).value_or(0);
    const std::uint8_t protocol = registry.interfaceProtocol(interface).value_or(0);
    // Only an interface that is *not* of printer class gets the short entry.
    if (protocol == 4 && subClass == 1 && interfaceClass != 7) {
        entries.push_back(hexadecimal(std::array{interfaceClass, subClass, protocol}));
        return;
    }
    const UsbInterfaceDescriptor* setting = nullptr;
    while ((setting = registry.nextInterfaceDescriptor(interface, setting)) != nullptr)
        if (setting->bInterfaceClass == 7 && setting->bInterfaceSubClass == 1 &&
            setting->bInterfaceProtocol == 4)
            entries.push_back(
                hexadecimal(std::array{interfaceClass, subClass, protocol, setting->bAlternateSetting}));
}

std::optional<std::string> joined(const std::vector<std::string>& entries) {
    std::string list;
    for (const auto& entry : entries)
        list += (list.empty() ? "" : ",") + entry;
    return list.empty() ? std::nullopt : std::optional{list};
}

}  // namespace

UsbInterfaceIdentity UsbInterfaceReader::readIdentity(const UsbInterfaceService& service) {
    const auto interface = registry_.openInterface(service);
    if (!interface)
        return {};
    return {registry_.interfaceLocation(*interface), registry_.interfaceNumber(*interface).value_or(0),
            registry_.deviceVendor(*interface).value_or(0), registry_.deviceProduct(*interface).value_or(0)};
}

std::optional<std::string> UsbInterfaceReader::requestDeviceID(const UsbInterfaceHandle& interface) {
    const auto configuration = registry_.configurationValue(interface);
    const auto number = registry_.interfaceNumber(interface);
    const auto setting = registry_.alternateSetting(interface);
    if (!configuration || !number || !setting)
        return std::nullopt;

    const auto ask = [&](std::uint16_t length) {
        UsbControlRequest request;
        request.bmRequestType = 0xA1;
        request.wValue = static_cast<std::uint16_t>(*configuration - 1);
        request.wIndex = static_cast<std::uint16_t>(*number << 8U | *setting);
        request.wLength = length;
        request.noDataTimeOut = kPatient;
        const auto status = registry_.controlRequest(interface, request);
        return status == UsbStatus::kSuccess ? std::optional{request} : std::nullopt;
    };
    const auto first = ask(256);
    if (!first || received(*first).size() < 2)
        return std::nullopt;
    const auto length = static_cast<std::uint16_t>(first->data[0] << 8U | first->data[1]);
    if (length >= 3 && length <= 254)
        return idText(*first, length);
    const auto second = ask(length);
    return second ? idText(*second, length) : std::nullopt;
}

std::optional<std::string> UsbInterfaceReader::readDeviceID(const UsbInterfaceService& service) {
    const auto interface = registry_.openInterface(service);
    if (!interface)
        return std::nullopt;
    std::string deviceID = requestDeviceID(*interface).value_or("");
    auto serialNumber = PMStringAdditions::serialNumber(deviceID);
    const bool hasMake = PMStringAdditions::make(deviceID).has_value();
    const bool hasModel = PMStringAdditions::model(deviceID).has_value();

    if (!hasMake || !hasModel || !serialNumber) {
        auto request = descriptorRequest(kDeviceDescriptor, 0, kDeviceDescriptorLength, kQuick);
        const auto status = registry_.controlRequest(*interface, request);
        if (status == UsbStatus::kSuccess && received(request).size() == kDeviceDescriptorLength) {
            std::string prefix;
            if (!hasMake)
                appendEntry(prefix, "MFG:", readStringDescriptor(*interface, request.data[kIManufacturer]));
            if (!hasModel)
                appendEntry(prefix, "MDL:", readStringDescriptor(*interface, request.data[kIProduct]));
            if (!serialNumber && request.data[kISerialNumber] != 0) {
                serialNumber = readStringDescriptor(*interface, request.data[kISerialNumber]);
                appendEntry(prefix, "SERN:", serialNumber);
            }
            deviceID.insert(0, prefix);
        }
    }
    if (serialNumber)
        removePlusFromSerialNumber(deviceID, *serialNumber);
    return deviceID.empty() ? std::nullopt : std::optional{deviceID};
}

std::optional<std::string> UsbInterfaceReader::readStringDescriptor(const UsbInterfaceHandle& interface,
                                                                    std::uint8_t index) {
    const auto descriptor = static_cast<std::uint16_t>(kStringDescriptors + index);
    auto header = descriptorRequest(descriptor, kUSEnglish, 2, kQuick);
    auto status = registry_.controlRequest(interface, header);
    // There are devices that do not answer for the header alone, or not so soon.
    if (status != UsbStatus::kSuccess && status != UsbStatus::kOverrun) {
        header = descriptorRequest(descriptor, kUSEnglish, 256, kPatient);
        status = registry_.controlRequest(interface, header);
        if (status != UsbStatus::kSuccess && status != UsbStatus::kUnderrun)
            return std::nullopt;
    }
    const std::size_t length = header.data[0];
    if (length == 0)
        return "";
    if (header.data[1] != kStringDescriptorType)
        return std::nullopt;

    auto request = descriptorRequest(descriptor, kUSEnglish, length, kQuick);
    if (registry_.controlRequest(interface, request) != UsbStatus::kSuccess)
        return std::nullopt;
    const auto bytes = received(request);
    if (bytes.size() < 2 || bytes[1] != kStringDescriptorType)
        return std::nullopt;
    std::string text;
    for (std::size_t i = 2; i + 1 < bytes.size(); i += 2)
        text += static_cast<char>(bytes[i]);
    return utf8(std::move(text));
}

std::optional<std::string> UsbInterfaceReader::listIPPOverUSBInterfaces(
    const UsbInterfaceService& service, const std::optional<std::string>& deviceID) {
    auto listed = PMStringAdditions::stringForKey(deviceID.value_or(""), "IPPE:");
    if (listed && !listed->empty())
        return listed;

    const auto interface = registry_.openInterface(service);
    const auto deviceService = interface ? registry_.deviceOfInterface(*interface) : nullptr;
    const auto device = deviceService ? registry_.openDevice(*deviceService) : nullptr;
    const auto siblings = device ? registry_.interfacesOfDevice(*device) : nullptr;
    if (!siblings)
        return std::nullopt;
    std::vector<std::string> entries;
    while (const auto sibling = registry_.nextInterface(*siblings))
        if (const auto handle = registry_.openInterface(*sibling))
            appendIPPOverUSBEntries(registry_, *handle, entries);
    return joined(entries);
}

}  // namespace ventras
