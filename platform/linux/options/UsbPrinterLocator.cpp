#include "platform/linux/options/UsbPrinterLocator.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <span>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

#include "deviceid/PMStringAdditions.h"
#include "platform/SeparatedURI.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

constexpr unsigned kWait = 5000;  // milliseconds
constexpr std::uint8_t kBidirectional = 2;

/// What a URI says of its printer.
struct Wanted {
    std::string model;
    std::string serialNumber;
    std::optional<std::uint32_t> location;
};

std::string withoutPlus(std::string text) {
    std::erase(text, '+');
    return text;
}

/// What follows a name at the beginning of a query; absent when the query begins otherwise.
std::optional<std::string_view> valueBehind(std::string_view name, std::string_view query) {
    return query.starts_with(name) ? std::optional{query.substr(name.size())} : std::nullopt;
}

std::optional<std::uint32_t> hexadecimal(std::string_view digits) {
    std::uint32_t number = 0;
    const auto* end = digits.data() + digits.size();
    const auto [stop, error] = std::from_chars(digits.data(), end, number, 16);
    return error == std::errc{} && stop == end ? std::optional{number} : std::nullopt;
}

std::optional<Wanted> wantedBy(const std::string& deviceURI) {
    const auto parts = SeparatedURI::from(deviceURI);
    if (parts.status < HTTP_URI_STATUS_OK || parts.scheme != "usb")
        return std::nullopt;
    std::string_view path = parts.resource;
    const auto question = std::min(path.rfind('?'), path.size());
    const auto query = path.substr(std::min(question + 1, path.size()));
    path = path.substr(0, question);
    if (path.starts_with('/'))
        path.remove_prefix(1);

    Wanted wanted{std::string(path), {}, {}};
    if (const auto serialNumber = valueBehind("serial=", query))
        wanted.serialNumber = withoutPlus(std::string(*serialNumber));
    if (const auto location = valueBehind("location=", query))
        wanted.location = hexadecimal(*location);
    return wanted.location || !wanted.serialNumber.empty() ? std::optional{wanted} : std::nullopt;
}

const LibusbSetting* bidirectionalSetting(const LibusbInterface& interface) {
    for (const auto& setting : interface.settings)
        if (setting.matches(kUsbPrinterInterfaces) &&
            setting.descriptor.bInterfaceProtocol == kBidirectional && setting.bulkIn && setting.bulkOut)
            return &setting;
    return nullptr;
}

/// The IEEE 1284 device ID; empty when the printer does not tell it.
std::string deviceIDOf(libusb_device_handle* handle, const LibusbDevice& device, std::uint8_t interface,
                       std::uint8_t alternate) {
    std::array<std::uint8_t, 1024> reply{};
    const int received = libusb_control_transfer(
        handle, 0xA1, 0, static_cast<std::uint16_t>(device.configuration - 1),
        static_cast<std::uint16_t>(interface << 8U | alternate), reply.data(), reply.size(), kWait);
    if (received < 2)
        return {};
    const std::size_t length = static_cast<std::size_t>(reply[0]) << 8U | reply[1];
    const auto text =
        std::span(reply).first(std::clamp<std::size_t>(length, 2, static_cast<std::size_t>(received)));
    return {text.begin() + 2, text.end()};
}

/// The serial number of the device's own descriptors, cut down to 8-bit characters as in queues' URIs.
std::string descriptorSerialNumber(libusb_device_handle* handle, libusb_device* device) {
    libusb_device_descriptor descriptor{};
    std::array<std::uint8_t, 255> reply{};
    if (libusb_get_device_descriptor(device, &descriptor) != 0 || descriptor.iSerialNumber == 0)
        return {};
    const int received =
        libusb_control_transfer(handle, LIBUSB_ENDPOINT_IN, LIBUSB_REQUEST_GET_DESCRIPTOR,
                                static_cast<std::uint16_t>(LIBUSB_DT_STRING << 8 | descriptor.iSerialNumber),
                                0x0409, reply.data(), reply.size(), kWait);
    std::string text;
    for (std::size_t at = 2; received > 0 && at + 1 < static_cast<std::size_t>(received); at += 2)
        text += static_cast<char>(reply.at(at));
    return text;
}

/// A printer with what it says of itself.
struct Candidate {
    UsbPrinterPlace place;
    std::string deviceID;
};

using Verdict = std::variant<Candidate, std::string>;

Verdict examine(const LibusbDevicePtr& device, const LibusbInterface& interface, const Wanted& wanted) {
    const auto* setting = bidirectionalSetting(interface);
    if (setting == nullptr)
        return "it talks in one direction only";
    int error = 0;
    const auto handle = device->open(error);
    if (!handle)
        return std::string("it cannot be opened: ") + libusb_strerror(error);
    const auto id =
        deviceIDOf(handle.get(), *device, interface.number, setting->descriptor.bAlternateSetting);
    if (!wanted.location) {
        // Read as the agent read it for the URI.
        auto serial = PMStringAdditions::serialNumber(id).value_or("");
        if (serial.empty())
            serial = descriptorSerialNumber(handle.get(), device->device.get());
        if (withoutPlus(serial) != wanted.serialNumber)
            return "no printer has that serial number";
    }
    auto commandSet = PMStringAdditions::commandSet(id).value_or("");
    return Candidate{{device, interface.number, *setting, std::move(commandSet)}, id};
}

}  // namespace

std::variant<UsbPrinterPlace, std::string> findUsbPrinter(LibusbContext& context,
                                                          const std::string& deviceURI) {
    const auto wanted = wantedBy(deviceURI);
    if (!wanted)
        return "its URI names no device of the USB";
    const auto devices = context.devices();
    if (!devices)
        return "the USB cannot be listed";

    std::vector<Candidate> candidates;
    std::string reason = "it is not attached";
    for (const auto& device : *devices)
        for (const auto& interface : device->interfaces) {
            if (!interface.hasSetting(kUsbPrinterInterfaces) ||
                (wanted->location && device->location != *wanted->location))
                continue;
            auto verdict = examine(device, interface, *wanted);
            if (auto* candidate = std::get_if<Candidate>(&verdict))
                candidates.push_back(std::move(*candidate));
            else
                reason = std::get<std::string>(verdict);
        }
    // Makers have given one serial number to many devices; then the model decides, if it can.
    if (candidates.size() > 1)
        std::erase_if(candidates, [&](const auto& each) {
            return each.deviceID.find(wanted->model) == std::string::npos;
        });
    if (candidates.size() > 1)
        return "several printers go by that URI";
    if (candidates.empty())
        return reason;
    return std::move(candidates.front().place);
}

}  // namespace ventras
