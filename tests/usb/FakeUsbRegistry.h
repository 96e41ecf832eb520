#pragma once

#include <cstdint>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/UsbRegistry.h"
#include "tests/parts/FakePrinter.h"

namespace ventras {

/// A UsbRegistry over FakePrinters, without a bus. Operations fail by name. One thread.
class FakeUsbRegistry final : public UsbRegistry {
public:
    /// Names of the operations that fail, e.g. "interfaceLocation".
    std::set<std::string, std::less<>> failing;
    /// Printer interfaces and their devices that are open, or were found, and are not released yet.
    int livingReferences = 0;
    /// Every control request, with its time-outs.
    std::vector<UsbControlRequest> requests;

    FakePrinter& attach(std::uint32_t location, FakePrinterModel model = {});

    std::unique_ptr<UsbInterfaceIterator> matchingInterfaces(const UsbInterfaceMatch& match) override;
    std::unique_ptr<UsbInterfaceIterator> interfacesOfDevice(const UsbDeviceHandle& device) override;
    std::unique_ptr<UsbInterfaceService> nextInterface(UsbInterfaceIterator& iterator) override;
    std::unique_ptr<UsbInterfaceHandle> openInterface(const UsbInterfaceService& service) override;
    std::unique_ptr<UsbDeviceService> deviceOfInterface(const UsbInterfaceHandle& interface) override;
    std::unique_ptr<UsbDeviceHandle> openDevice(const UsbDeviceService& service) override;
    std::optional<std::uint32_t> interfaceLocation(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> interfaceNumber(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> interfaceClass(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> interfaceSubClass(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> interfaceProtocol(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> configurationValue(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint8_t> alternateSetting(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint16_t> deviceVendor(const UsbInterfaceHandle& interface) override;
    std::optional<std::uint16_t> deviceProduct(const UsbInterfaceHandle& interface) override;
    const UsbInterfaceDescriptor* nextInterfaceDescriptor(const UsbInterfaceHandle& interface,
                                                          const UsbInterfaceDescriptor* previous) override;
    UsbStatus controlRequest(const UsbInterfaceHandle& interface, UsbControlRequest& request) override;

private:
    struct Attached {
        std::uint32_t location;
        std::unique_ptr<FakePrinter> printer;
    };
    struct Place {
        const Attached* device = nullptr;
        std::uint8_t interface = 0;
    };
    template <class Kind>
    struct Reference;
    template <class Kind>
    std::unique_ptr<Kind> hand(std::string_view operation, Place place);
    template <class Kind>
    static Place placeOf(const Kind& reference);
    template <class Value>
    std::optional<Value> read(std::string_view operation, Value value) const;
    std::optional<std::uint8_t> readCurrent(std::string_view operation, const UsbInterfaceHandle& interface,
                                            std::uint8_t FakeUsbSetting::*value) const;

    struct Iterator;
    std::vector<std::unique_ptr<Attached>> devices_;
};

}  // namespace ventras
