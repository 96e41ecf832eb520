#pragma once

#include "platform/UsbRegistry.h"

namespace ventras {

/// A USB with nothing attached.
class EmptyUsbRegistry final : public UsbRegistry {
public:
    std::unique_ptr<UsbInterfaceIterator> matchingInterfaces(const UsbInterfaceMatch&) override {
        return nullptr;
    }
    std::unique_ptr<UsbInterfaceIterator> interfacesOfDevice(const UsbDeviceHandle&) override {
        return nullptr;
    }
    std::unique_ptr<UsbInterfaceService> nextInterface(UsbInterfaceIterator&) override { return nullptr; }
    std::unique_ptr<UsbInterfaceHandle> openInterface(const UsbInterfaceService&) override { return nullptr; }
    std::unique_ptr<UsbDeviceService> deviceOfInterface(const UsbInterfaceHandle&) override {
        return nullptr;
    }
    std::unique_ptr<UsbDeviceHandle> openDevice(const UsbDeviceService&) override { return nullptr; }
    std::optional<std::uint32_t> interfaceLocation(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> interfaceNumber(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> interfaceClass(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> interfaceSubClass(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> interfaceProtocol(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> configurationValue(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint8_t> alternateSetting(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint16_t> deviceVendor(const UsbInterfaceHandle&) override { return {}; }
    std::optional<std::uint16_t> deviceProduct(const UsbInterfaceHandle&) override { return {}; }
    const UsbInterfaceDescriptor* nextInterfaceDescriptor(const UsbInterfaceHandle&,
                                                          const UsbInterfaceDescriptor*) override {
        return nullptr;
    }
    UsbStatus controlRequest(const UsbInterfaceHandle&, UsbControlRequest&) override {
        return UsbStatus::kNoDevice;
    }
};

}  // namespace ventras
