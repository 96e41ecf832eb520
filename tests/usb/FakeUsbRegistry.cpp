#include "tests/usb/FakeUsbRegistry.h"

#include <algorithm>
#include <cerrno>
#include <deque>

namespace ventras {

template <class Kind>
struct FakeUsbRegistry::Reference final : Kind {
    Reference(int& living, Place where) : counter(living), place(where) {
        ++counter;
        if (place.device == nullptr)
            return;
        for (const auto& setting : place.device->printer->model().settings)
            if (setting.interface == place.interface)
                descriptors.push_back(
                    {setting.alternate, setting.interfaceClass, setting.subClass, setting.protocol});
    }
    ~Reference() override { --counter; }
    Reference(const Reference&) = delete;
    Reference& operator=(const Reference&) = delete;

    int& counter;
    Place place;
    std::vector<UsbInterfaceDescriptor> descriptors;
};

struct FakeUsbRegistry::Iterator final : UsbInterfaceIterator {
    explicit Iterator(int& living) : counter(living) { ++counter; }
    ~Iterator() override { --counter; }
    Iterator(const Iterator&) = delete;
    Iterator& operator=(const Iterator&) = delete;

    int& counter;
    std::deque<Place> places;
};

template <class Kind>
std::unique_ptr<Kind> FakeUsbRegistry::hand(std::string_view operation, Place place) {
    if (failing.contains(operation))
        return nullptr;
    return std::make_unique<Reference<Kind>>(livingReferences, place);
}

template <class Kind>
FakeUsbRegistry::Place FakeUsbRegistry::placeOf(const Kind& reference) {
    return dynamic_cast<const Reference<Kind>&>(reference).place;
}

template <class Value>
std::optional<Value> FakeUsbRegistry::read(std::string_view operation, Value value) const {
    return failing.contains(operation) ? std::nullopt : std::optional{value};
}

std::optional<std::uint8_t> FakeUsbRegistry::readCurrent(std::string_view operation,
                                                         const UsbInterfaceHandle& interface,
                                                         std::uint8_t FakeUsbSetting::*value) const {
    const auto [device, number] = placeOf(interface);
    const auto* setting = device->printer->setting(number, device->printer->currentSetting(number));
    return setting == nullptr ? std::nullopt : read(operation, setting->*value);
}

FakePrinter& FakeUsbRegistry::attach(std::uint32_t location, FakePrinterModel model) {
    devices_.push_back(
        std::make_unique<Attached>(Attached{location, std::make_unique<FakePrinter>(std::move(model))}));
    return *devices_.back()->printer;
}

std::unique_ptr<UsbInterfaceIterator> FakeUsbRegistry::matchingInterfaces(const UsbInterfaceMatch& match) {
    if (failing.contains("matchingInterfaces"))
        return nullptr;
    auto iterator = std::make_unique<Iterator>(livingReferences);
    std::set<std::pair<const Attached*, std::uint8_t>> seen;
    for (const auto& device : devices_)
        for (const auto& setting : device->printer->model().settings)
            if (setting.interfaceClass == match.bInterfaceClass &&
                setting.subClass == match.bInterfaceSubClass &&
                seen.emplace(device.get(), setting.interface).second)
                iterator->places.push_back({device.get(), setting.interface});
    return iterator;
}

std::unique_ptr<UsbInterfaceIterator> FakeUsbRegistry::interfacesOfDevice(const UsbDeviceHandle& device) {
    if (failing.contains("interfacesOfDevice"))
        return nullptr;
    auto iterator = std::make_unique<Iterator>(livingReferences);
    const auto* attached = placeOf(device).device;
    std::set<std::uint8_t> seen;
    for (const auto& setting : attached->printer->model().settings)
        if (seen.insert(setting.interface).second)
            iterator->places.push_back({attached, setting.interface});
    return iterator;
}

std::unique_ptr<UsbInterfaceService> FakeUsbRegistry::nextInterface(UsbInterfaceIterator& iterator) {
    auto& places = dynamic_cast<Iterator&>(iterator).places;
    if (places.empty())
        return nullptr;
    const auto place = places.front();
    places.pop_front();
    return hand<UsbInterfaceService>("nextInterface", place);
}

std::unique_ptr<UsbInterfaceHandle> FakeUsbRegistry::openInterface(const UsbInterfaceService& service) {
    return hand<UsbInterfaceHandle>("openInterface", placeOf(service));
}

std::unique_ptr<UsbDeviceService> FakeUsbRegistry::deviceOfInterface(const UsbInterfaceHandle& interface) {
    return hand<UsbDeviceService>("deviceOfInterface", placeOf(interface));
}

std::unique_ptr<UsbDeviceHandle> FakeUsbRegistry::openDevice(const UsbDeviceService& service) {
    return hand<UsbDeviceHandle>("openDevice", placeOf(service));
}

std::optional<std::uint32_t> FakeUsbRegistry::interfaceLocation(const UsbInterfaceHandle& interface) {
    return read("interfaceLocation", placeOf(interface).device->location);
}

std::optional<std::uint8_t> FakeUsbRegistry::interfaceNumber(const UsbInterfaceHandle& interface) {
    return read("interfaceNumber", placeOf(interface).interface);
}

std::optional<std::uint8_t> FakeUsbRegistry::interfaceClass(const UsbInterfaceHandle& interface) {
    return readCurrent("interfaceClass", interface, &FakeUsbSetting::interfaceClass);
}

std::optional<std::uint8_t> FakeUsbRegistry::interfaceSubClass(const UsbInterfaceHandle& interface) {
    return readCurrent("interfaceSubClass", interface, &FakeUsbSetting::subClass);
}

std::optional<std::uint8_t> FakeUsbRegistry::interfaceProtocol(const UsbInterfaceHandle& interface) {
    return readCurrent("interfaceProtocol", interface, &FakeUsbSetting::protocol);
}

std::optional<std::uint8_t> FakeUsbRegistry::configurationValue(const UsbInterfaceHandle& interface) {
    return read("configurationValue", placeOf(interface).device->printer->model().configuration);
}

std::optional<std::uint8_t> FakeUsbRegistry::alternateSetting(const UsbInterfaceHandle& interface) {
    return readCurrent("alternateSetting", interface, &FakeUsbSetting::alternate);
}

std::optional<std::uint16_t> FakeUsbRegistry::deviceVendor(const UsbInterfaceHandle& interface) {
    return read("deviceVendor", placeOf(interface).device->printer->model().vendor);
}

std::optional<std::uint16_t> FakeUsbRegistry::deviceProduct(const UsbInterfaceHandle& interface) {
    return read("deviceProduct", placeOf(interface).device->printer->model().product);
}

const UsbInterfaceDescriptor* FakeUsbRegistry::nextInterfaceDescriptor(
    const UsbInterfaceHandle& interface, const UsbInterfaceDescriptor* previous) {
    const auto& descriptors = dynamic_cast<const Reference<UsbInterfaceHandle>&>(interface).descriptors;
    const std::size_t next =
        previous == nullptr ? 0 : static_cast<std::size_t>(previous - descriptors.data()) + 1;
    return next < descriptors.size() ? &descriptors[next] : nullptr;
}

UsbStatus FakeUsbRegistry::controlRequest(const UsbInterfaceHandle& interface, UsbControlRequest& request) {
    auto answer = placeOf(interface).device->printer->control(
        {request.bmRequestType, request.bRequest, request.wValue, request.wIndex, request.wLength});
    const bool overrun = answer.error == EOVERFLOW || answer.data.size() > request.wLength;
    request.bytesTransferred =
        static_cast<std::uint32_t>(std::min<std::size_t>(answer.data.size(), request.wLength));
    answer.data.resize(request.wLength);
    request.data = answer.data;
    requests.push_back(request);
    if (answer.error == ETIMEDOUT ||
        (request.noDataTimeOut.count() > 0 && answer.after > request.noDataTimeOut))
        return UsbStatus::kTimeOut;
    if (overrun)
        return UsbStatus::kOverrun;
    switch (answer.error) {
        case 0:
            return UsbStatus::kSuccess;
        case EPIPE:
            return UsbStatus::kStall;
        case EREMOTEIO:
            return UsbStatus::kUnderrun;
        case ENODEV:
            return UsbStatus::kNoDevice;
        default:
            return UsbStatus::kFailed;
    }
}

}  // namespace ventras
