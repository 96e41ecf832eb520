#include "platform/linux/usb/LibusbDevice.h"

#include <algorithm>
#include <array>
#include <fstream>
#include <span>
#include <string>
#include <utility>

#include "platform/UsbLocation.h"

namespace ventras {
namespace {

// USB allows five hubs below the root, so a path has at most six ports: one hexadecimal digit each below the
// bus number. A root hub may have more than 15 ports; of such a port the lowest digit is kept, as the
// hot-plug helper does.
constexpr int kMostPorts = 6;

std::vector<std::uint8_t> portPath(libusb_device* device) {
    std::array<std::uint8_t, kMostPorts + 1> ports{};
    const int count = libusb_get_port_numbers(device, ports.data(), static_cast<int>(ports.size()));
    return {ports.begin(), ports.begin() + std::clamp(count, 0, kMostPorts)};
}

std::uint32_t locationOf(libusb_device* device) {
    return usbLocation(libusb_get_bus_number(device), portPath(device));
}

std::optional<std::uint8_t> bulkEndpoint(std::span<const libusb_endpoint_descriptor> endpoints,
                                         int direction) {
    for (const auto& endpoint : endpoints)
        if ((endpoint.bmAttributes & 3U) == LIBUSB_TRANSFER_TYPE_BULK &&
            (endpoint.bEndpointAddress & 0x80U) == static_cast<unsigned>(direction))
            return endpoint.bEndpointAddress;
    return std::nullopt;
}

LibusbSetting settingFrom(const libusb_interface_descriptor& descriptor) {
    const std::span endpoints(descriptor.endpoint, descriptor.bNumEndpoints);
    return {{descriptor.bAlternateSetting, descriptor.bInterfaceClass, descriptor.bInterfaceSubClass,
             descriptor.bInterfaceProtocol},
            bulkEndpoint(endpoints, LIBUSB_ENDPOINT_OUT),
            bulkEndpoint(endpoints, LIBUSB_ENDPOINT_IN)};
}

std::vector<LibusbInterface> interfacesFrom(const libusb_config_descriptor& configuration) {
    std::vector<LibusbInterface> interfaces;
    for (const auto& entry : std::span(configuration.interface, configuration.bNumInterfaces)) {
        if (entry.num_altsetting <= 0)
            continue;
        LibusbInterface interface {
            entry.altsetting->bInterfaceNumber, {}
        };
        for (const auto& setting :
             std::span(entry.altsetting, static_cast<std::size_t>(entry.num_altsetting)))
            interface.settings.push_back(settingFrom(setting));
        interfaces.push_back(std::move(interface));
    }
    return interfaces;
}

/// Absent for a device that is not configured; it has no interfaces.
LibusbDevicePtr describe(libusb_device* device) {
    libusb_device_descriptor descriptor{};
    libusb_config_descriptor* configuration = nullptr;
    if (libusb_get_device_descriptor(device, &descriptor) != 0 ||
        libusb_get_active_config_descriptor(device, &configuration) != 0)
        return nullptr;
    const std::unique_ptr<libusb_config_descriptor, decltype(&libusb_free_config_descriptor)> owner{
        configuration, libusb_free_config_descriptor};
    return std::make_shared<LibusbDevice>(
        LibusbDevice{std::shared_ptr<libusb_device>(libusb_ref_device(device), libusb_unref_device),
                     locationOf(device), descriptor.idVendor, descriptor.idProduct,
                     configuration->bConfigurationValue, interfacesFrom(*configuration)});
}

}  // namespace

bool LibusbSetting::matches(const UsbInterfaceMatch& match) const {
    return descriptor.bInterfaceClass == match.bInterfaceClass &&
           descriptor.bInterfaceSubClass == match.bInterfaceSubClass;
}

bool LibusbInterface::hasSetting(const UsbInterfaceMatch& match) const {
    return std::ranges::any_of(settings, [&](const auto& setting) { return setting.matches(match); });
}

const LibusbSetting* LibusbInterface::setting(std::uint8_t alternate) const {
    const auto found = std::ranges::find_if(
        settings, [=](const auto& setting) { return setting.descriptor.bAlternateSetting == alternate; });
    return found == settings.end() ? nullptr : &*found;
}

std::uint8_t LibusbDevice::currentSetting(std::uint8_t interface) const {
    // libusb can only ask the device, and would have to open it; the kernel knows. Without its word, an
    // interface is in setting 0, as after every configuration (USB 2.0 section 9.2.3).
    std::string path = "/sys/bus/usb/devices/" + std::to_string(libusb_get_bus_number(device.get()));
    char separator = '-';
    for (const auto port : portPath(device.get())) {
        path += separator + std::to_string(port);
        separator = '.';
    }
    path += ":" + std::to_string(configuration) + "." + std::to_string(interface) + "/bAlternateSetting";
    unsigned setting = 0;
    std::ifstream(path) >> setting;
    return static_cast<std::uint8_t>(setting);
}

LibusbHandle LibusbDevice::open(int& error) const {
    libusb_device_handle* handle = nullptr;
    error = libusb_open(device.get(), &handle);
    return LibusbHandle{error == 0 ? handle : nullptr};
}

LibusbContext::~LibusbContext() {
    if (context_ != nullptr)
        libusb_exit(context_);
}

libusb_context* LibusbContext::context() {
    std::call_once(once_, [this] {
        if (libusb_init(&context_) != 0)
            context_ = nullptr;
    });
    return context_;
}

std::optional<std::vector<LibusbDevicePtr>> LibusbContext::devices() {
    libusb_device** list = nullptr;
    // Without a context libusb would make a default one that nobody ends.
    const auto count = context() == nullptr ? -1 : libusb_get_device_list(context_, &list);
    if (count < 0)
        return std::nullopt;
    std::vector<LibusbDevicePtr> devices;
    for (auto* device : std::span(list, static_cast<std::size_t>(count)))
        if (auto described = describe(device))
            devices.push_back(std::move(described));
    libusb_free_device_list(list, 1);
    std::ranges::stable_sort(devices, {}, &LibusbDevice::location);
    return devices;
}

}  // namespace ventras
