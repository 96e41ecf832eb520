#include "platform/linux/usb/LibusbRegistry.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <iterator>
#include <utility>

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr std::uint16_t kMostControlData = 4096;
// For a request without any time-out of its own: nothing may wait for ever.
constexpr auto kLongestWait = 5000ms;

/// One interface of one device, and for what it was found.
struct Place {
    LibusbDevicePtr device;
    const LibusbInterface* interface = nullptr;
    std::optional<UsbInterfaceMatch> match;
};

struct Iterator final : UsbInterfaceIterator {
    explicit Iterator(std::vector<Place> found) : places(std::move(found)) {}
    std::vector<Place> places;
    std::size_t next = 0;
};

struct InterfaceService final : UsbInterfaceService {
    explicit InterfaceService(Place where) : place(std::move(where)) {}
    Place place;
};

struct InterfaceHandle final : UsbInterfaceHandle {
    explicit InterfaceHandle(Place where) : place(std::move(where)) {}
    Place place;
    // Opened by the first request: most interfaces are only looked at.
    mutable LibusbHandle handle;
};

struct DeviceService final : UsbDeviceService {
    explicit DeviceService(LibusbDevicePtr described) : device(std::move(described)) {}
    LibusbDevicePtr device;
};

struct DeviceHandle final : UsbDeviceHandle {
    explicit DeviceHandle(LibusbDevicePtr described) : device(std::move(described)) {}
    LibusbDevicePtr device;
};

const InterfaceHandle& own(const UsbInterfaceHandle& interface) {
    return static_cast<const InterfaceHandle&>(interface);
}

const LibusbSetting* currentSetting(const UsbInterfaceHandle& interface) {
    const auto& place = own(interface).place;
    return place.interface->setting(place.device->currentSetting(place.interface->number));
}

template <class Value>
std::optional<Value> ofCurrentSetting(const UsbInterfaceHandle& interface,
                                      Value UsbInterfaceDescriptor::*value) {
    const auto* setting = currentSetting(interface);
    return setting == nullptr ? std::nullopt : std::optional{setting->descriptor.*value};
}

struct StatusRow {
    int error;
    UsbStatus status;
};

constexpr std::array kStatuses{
    StatusRow{LIBUSB_SUCCESS, UsbStatus::kSuccess},
    StatusRow{LIBUSB_ERROR_PIPE, UsbStatus::kStall},
    StatusRow{LIBUSB_ERROR_TIMEOUT, UsbStatus::kTimeOut},
    StatusRow{LIBUSB_ERROR_OVERFLOW, UsbStatus::kOverrun},
    StatusRow{LIBUSB_ERROR_NO_DEVICE, UsbStatus::kNoDevice},
    StatusRow{LIBUSB_ERROR_ACCESS, UsbStatus::kAccessDenied},
};

UsbStatus statusOf(int error) {
    const auto row = std::ranges::find(kStatuses, error, &StatusRow::error);
    return row == kStatuses.end() ? UsbStatus::kFailed : row->status;
}

std::chrono::milliseconds timeOut(const UsbControlRequest& request) {
    auto shortest = kLongestWait;
    for (const auto wait : {request.noDataTimeOut, request.completionTimeOut})
        if (wait > 0ms)
            shortest = std::min(shortest, wait);
    return shortest;
}

}  // namespace

std::unique_ptr<UsbInterfaceIterator> LibusbRegistry::matchingInterfaces(const UsbInterfaceMatch& match) {
    const auto devices = context_.devices();
    if (!devices)
        return nullptr;
    std::vector<Place> places;
    for (const auto& device : *devices)
        for (const auto& interface : device->interfaces)
            if (interface.hasSetting(match))
                places.push_back({device, &interface, match});
    return std::make_unique<Iterator>(std::move(places));
}

std::unique_ptr<UsbInterfaceIterator> LibusbRegistry::interfacesOfDevice(const UsbDeviceHandle& device) {
    const auto& described = static_cast<const DeviceHandle&>(device).device;
    std::vector<Place> places;
    std::ranges::transform(described->interfaces, std::back_inserter(places), [&](const auto& interface) {
        return Place{described, &interface, std::nullopt};
    });
    return std::make_unique<Iterator>(std::move(places));
}

std::unique_ptr<UsbInterfaceService> LibusbRegistry::nextInterface(UsbInterfaceIterator& iterator) {
    auto& walk = static_cast<Iterator&>(iterator);
    if (walk.next == walk.places.size())
        return nullptr;
    return std::make_unique<InterfaceService>(walk.places[walk.next++]);
}

std::unique_ptr<UsbInterfaceHandle> LibusbRegistry::openInterface(const UsbInterfaceService& service) {
    return std::make_unique<InterfaceHandle>(static_cast<const InterfaceService&>(service).place);
}

std::unique_ptr<UsbDeviceService> LibusbRegistry::deviceOfInterface(const UsbInterfaceHandle& interface) {
    return std::make_unique<DeviceService>(own(interface).place.device);
}

std::unique_ptr<UsbDeviceHandle> LibusbRegistry::openDevice(const UsbDeviceService& service) {
    return std::make_unique<DeviceHandle>(static_cast<const DeviceService&>(service).device);
}

std::optional<std::uint32_t> LibusbRegistry::interfaceLocation(const UsbInterfaceHandle& interface) {
    return own(interface).place.device->location;
}

std::optional<std::uint8_t> LibusbRegistry::interfaceNumber(const UsbInterfaceHandle& interface) {
    return own(interface).place.interface->number;
}

std::optional<std::uint8_t> LibusbRegistry::interfaceClass(const UsbInterfaceHandle& interface) {
    return ofCurrentSetting(interface, &UsbInterfaceDescriptor::bInterfaceClass);
}

std::optional<std::uint8_t> LibusbRegistry::interfaceSubClass(const UsbInterfaceHandle& interface) {
    return ofCurrentSetting(interface, &UsbInterfaceDescriptor::bInterfaceSubClass);
}

std::optional<std::uint8_t> LibusbRegistry::interfaceProtocol(const UsbInterfaceHandle& interface) {
    return ofCurrentSetting(interface, &UsbInterfaceDescriptor::bInterfaceProtocol);
}

std::optional<std::uint8_t> LibusbRegistry::configurationValue(const UsbInterfaceHandle& interface) {
    return own(interface).place.device->configuration;
}

std::optional<std::uint8_t> LibusbRegistry::alternateSetting(const UsbInterfaceHandle& interface) {
    const auto& place = own(interface).place;
    const auto* current = currentSetting(interface);
    // usbfs only lets requests of the printer class through that name a setting of that class.
    if (place.match && (current == nullptr || !current->matches(*place.match)))
        for (const auto& setting : place.interface->settings)
            if (setting.matches(*place.match))
                return setting.descriptor.bAlternateSetting;
    return current == nullptr ? std::nullopt : std::optional{current->descriptor.bAlternateSetting};
}

std::optional<std::uint16_t> LibusbRegistry::deviceVendor(const UsbInterfaceHandle& interface) {
    return own(interface).place.device->vendor;
}

std::optional<std::uint16_t> LibusbRegistry::deviceProduct(const UsbInterfaceHandle& interface) {
    return own(interface).place.device->product;
}

const UsbInterfaceDescriptor* LibusbRegistry::nextInterfaceDescriptor(
    const UsbInterfaceHandle& interface, const UsbInterfaceDescriptor* previous) {
    bool isNext = previous == nullptr;
    for (const auto& setting : own(interface).place.interface->settings) {
        if (isNext)
            return &setting.descriptor;
        isNext = &setting.descriptor == previous;
    }
    return nullptr;
}

UsbStatus LibusbRegistry::controlRequest(const UsbInterfaceHandle& interface, UsbControlRequest& request) {
    const auto& target = own(interface);
    request.bytesTransferred = 0;
    request.data.assign(request.wLength, 0);
    if (!target.handle) {
        int error = LIBUSB_SUCCESS;
        target.handle = target.place.device->open(error);
        if (!target.handle)
            return statusOf(error);
    }
    const int result = libusb_control_transfer(target.handle.get(), request.bmRequestType, request.bRequest,
                                               request.wValue, request.wIndex, request.data.data(),
                                               std::min(request.wLength, kMostControlData),
                                               static_cast<unsigned>(timeOut(request).count()));
    if (result < 0)
        return statusOf(result);
    request.bytesTransferred = static_cast<std::uint32_t>(result);
    return UsbStatus::kSuccess;
}

}  // namespace ventras
