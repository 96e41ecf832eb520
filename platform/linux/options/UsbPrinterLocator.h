#pragma once

#include <string>
#include <variant>

#include "platform/linux/usb/LibusbDevice.h"

namespace ventras {

/// A printer that can be talked to in both directions, as a queue's device URI names it. It must go before
/// the LibusbContext that it came from.
struct UsbPrinterPlace {
    LibusbDevicePtr device;
    std::uint8_t interface = 0;
    LibusbSetting setting;   ///< the one to talk through; has both endpoints
    std::string commandSet;  ///< the printer languages of the IEEE 1284 device ID; empty when it tells none
};

/// Finds the printer of a URI "usb://make/model?serial=..." or "usb://make/model?location=...". The location
/// names a device outright; for a serial number the printers that are attached are asked for theirs.
/// @return the printer, or why there is none.
std::variant<UsbPrinterPlace, std::string> findUsbPrinter(LibusbContext& context,
                                                          const std::string& deviceURI);

}  // namespace ventras
