#pragma once

#include <cstdint>
#include <memory>
#include <optional>

#include "platform/UsbControlRequest.h"

namespace ventras {

/// Which interfaces to look for (USB 2.0 section 9.6.5).
struct UsbInterfaceMatch {
    std::uint8_t bInterfaceClass = 0;
    std::uint8_t bInterfaceSubClass = 0;
};

/// Printers, whatever protocol they speak (USB Printer Class 1.1 section 4.2).
inline constexpr UsbInterfaceMatch kUsbPrinterInterfaces{7, 1};

/// One of an interface's settings, as the device's configuration describes it (USB 2.0 section 9.6.5).
struct UsbInterfaceDescriptor {
    std::uint8_t bAlternateSetting = 0;
    std::uint8_t bInterfaceClass = 0;
    std::uint8_t bInterfaceSubClass = 0;
    std::uint8_t bInterfaceProtocol = 0;

    bool operator==(const UsbInterfaceDescriptor&) const = default;
};

/// Something that a UsbRegistry handed out; only that registry knows what is in it. Destroying it releases
/// it.
class UsbReference {
public:
    UsbReference() = default;
    UsbReference(const UsbReference&) = delete;
    UsbReference& operator=(const UsbReference&) = delete;
    virtual ~UsbReference() = default;
};

class UsbInterfaceIterator : public UsbReference {};  ///< a walk over interfaces
class UsbInterfaceService : public UsbReference {};   ///< an interface that exists
class UsbInterfaceHandle : public UsbReference {};    ///< an interface that is open
class UsbDeviceService : public UsbReference {};      ///< a device that exists
class UsbDeviceHandle : public UsbReference {};       ///< a device that is open

/// What is attached to the USB, and the requests that printers are asked. An absent result means that the
/// value could not be read, or that there is no such thing.
///
/// Any thread may call; one reference belongs to one thread at a time, and to the registry that handed it
/// out, which outlives it.
class UsbRegistry {
public:
    virtual ~UsbRegistry() = default;

    /// The interfaces of all devices that have a setting of that class, current or not.
    virtual std::unique_ptr<UsbInterfaceIterator> matchingInterfaces(const UsbInterfaceMatch& match) = 0;

    /// Every interface of one device.
    virtual std::unique_ptr<UsbInterfaceIterator> interfacesOfDevice(const UsbDeviceHandle& device) = 0;

    /// The iterator's next interface; null at its end.
    virtual std::unique_ptr<UsbInterfaceService> nextInterface(UsbInterfaceIterator& iterator) = 0;

    virtual std::unique_ptr<UsbInterfaceHandle> openInterface(const UsbInterfaceService& service) = 0;
    virtual std::unique_ptr<UsbDeviceService> deviceOfInterface(const UsbInterfaceHandle& interface) = 0;
    virtual std::unique_ptr<UsbDeviceHandle> openDevice(const UsbDeviceService& service) = 0;

    /// Where the device sits: its usbLocation().
    virtual std::optional<std::uint32_t> interfaceLocation(const UsbInterfaceHandle& interface) = 0;
    virtual std::optional<std::uint8_t> interfaceNumber(const UsbInterfaceHandle& interface) = 0;

    /// Class, subclass and protocol of the current setting.
    virtual std::optional<std::uint8_t> interfaceClass(const UsbInterfaceHandle& interface) = 0;
    virtual std::optional<std::uint8_t> interfaceSubClass(const UsbInterfaceHandle& interface) = 0;
    virtual std::optional<std::uint8_t> interfaceProtocol(const UsbInterfaceHandle& interface) = 0;

    /// bConfigurationValue of the active configuration.
    virtual std::optional<std::uint8_t> configurationValue(const UsbInterfaceHandle& interface) = 0;

    /// The setting for which the interface was found: the current one, unless only another one matches.
    virtual std::optional<std::uint8_t> alternateSetting(const UsbInterfaceHandle& interface) = 0;

    virtual std::optional<std::uint16_t> deviceVendor(const UsbInterfaceHandle& interface) = 0;  ///< idVendor
    virtual std::optional<std::uint16_t> deviceProduct(
        const UsbInterfaceHandle& interface) = 0;  ///< idProduct

    /// The setting after `previous` in the order of the device's configuration; null gives the first. The
    /// result belongs to the interface.
    /// @return null at the end.
    virtual const UsbInterfaceDescriptor* nextInterfaceDescriptor(const UsbInterfaceHandle& interface,
                                                                  const UsbInterfaceDescriptor* previous) = 0;

    /// Asks the device and fills in the request. `data` has wLength bytes afterwards, whatever came of it.
    virtual UsbStatus controlRequest(const UsbInterfaceHandle& interface, UsbControlRequest& request) = 0;
};

}  // namespace ventras
