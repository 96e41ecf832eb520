#pragma once

#include "platform/UsbRegistry.h"
#include "platform/linux/usb/LibusbDevice.h"

namespace ventras {

/// The USB through libusb-1.0.
///
/// Listing and describing use what the kernel has read already, so no device is opened, or woken up, before
/// it is asked something; that takes write access to its node. Nothing is ever claimed: the requests of
/// UsbRegistry reach a printer while the kernel's own driver serves it. Nothing happens before the first use.
class LibusbRegistry final : public UsbRegistry {
public:
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

    /// usbfs moves at most 4096 bytes of control data; a request for more asks for that much.
    UsbStatus controlRequest(const UsbInterfaceHandle& interface, UsbControlRequest& request) override;

private:
    LibusbContext context_;
};

}  // namespace ventras
