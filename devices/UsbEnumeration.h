#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "devices/USBPrinterObject.h"
#include "platform/UsbRegistry.h"

namespace ventras {

/// Finds the USB printers that are wanted. A printer that speaks IPP over USB is none of them: it is served
/// as the IPP printer that it is. Use it on one thread.
class UsbEnumeration {
public:
    using PrinterPtr = std::shared_ptr<USBPrinterObject>;

    /// Texts "location,interface number", both in decimal, e.g. "336592896,0".
    using LocationFilter = std::vector<std::string>;

    UsbEnumeration(Platform& platform, PPDManager& drivers, UsbRegistry& registry)
        : platform_(platform), drivers_(drivers), registry_(registry) {}

    /// The printers at the given places.
    std::vector<PrinterPtr> printerObjects(const LocationFilter& filter);

    /// The printer half of a multifunction device whose scanner sits at that place; null when it has none.
    PrinterPtr printerObjectForScanner(std::uint32_t location, std::uint32_t vendor, std::uint32_t product);

    /// The printer behind an interface; null when it is not wanted, does not tell what it is, or speaks IPP.
    PrinterPtr printerObjectForInterface(const UsbInterfaceService& service, const LocationFilter& filter);

    /// The printer behind an interface of that very device, as interface 0; null when it is another device's.
    PrinterPtr printerObjectForScannerLocation(const UsbInterfaceService& service, std::uint32_t location,
                                               std::uint16_t vendor, std::uint16_t product);

private:
    Platform& platform_;
    PPDManager& drivers_;
    UsbRegistry& registry_;
};

}  // namespace ventras
