#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/UsbRegistry.h"

namespace ventras {

/// Which interface of which device this is.
struct UsbInterfaceIdentity {
    std::optional<std::uint32_t> location;  ///< absent when it cannot be read
    std::uint8_t interfaceNumber = 0;       ///< like the rest 0 when it cannot be read
    std::uint16_t vendorID = 0;
    std::uint16_t productID = 0;
};

/// Asks one printer interface what it is. Nothing that a device answers, or leaves unanswered, is an error:
/// what cannot be read is absent. Use it on one thread.
class UsbInterfaceReader {
public:
    explicit UsbInterfaceReader(UsbRegistry& registry) : registry_(registry) {}

    UsbInterfaceIdentity readIdentity(const UsbInterfaceService& service);

    /// The printer's IEEE 1284 device ID (USB Printer Class 1.1 section 4.2.1), with make, model and serial
    /// number put in front from the device's string descriptors where the ID itself lacks them.
    std::optional<std::string> readDeviceID(const UsbInterfaceService& service);

    /// A string descriptor in US English (USB 2.0 section 9.6.7), cut down to 8-bit characters.
    std::optional<std::string> readStringDescriptor(const UsbInterfaceHandle& interface, std::uint8_t index);

    /// The interfaces over which the device speaks IPP (IPP-USB 1.0), e.g. "07-01-04-00,07-01-02-01", from
    /// the device ID's own list if there is one.
    std::optional<std::string> listIPPOverUSBInterfaces(const UsbInterfaceService& service,
                                                        const std::optional<std::string>& deviceID);

private:
    std::optional<std::string> requestDeviceID(const UsbInterfaceHandle& interface);

    UsbRegistry& registry_;
};

}  // namespace ventras
