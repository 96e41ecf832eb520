#pragma once

#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// Description of a queue to be created, as it goes to the print system.
using QueueAttributes = PropertyDictionary;

/// Keys of a QueueAttributes dictionary; all values are texts unless said otherwise.
namespace QueueAttributeKeys {
inline constexpr std::string_view kPrinterURI = "Printer URI";  ///< the device URI; always present
inline constexpr std::string_view kPPD = "com.quillon.print.PrinterInfo.PPD";  ///< path of the PPD file
inline constexpr std::string_view kManufacturer = "MANUFACTURER:";
inline constexpr std::string_view kModel = "MODEL:";
inline constexpr std::string_view kUSBAddressLocationID = "USBAddressLocationID";  ///< lower-case hexadecimal
inline constexpr std::string_view kSerialNumber = "SERN:";
inline constexpr std::string_view kPrinterAddress = "com.quillon.print.PrinterInfo.PMPrinterAddress";
inline constexpr std::string_view kScanner = "Scanner";  ///< boolean true, for the queue of a scanner
inline constexpr std::string_view kLocation = "Location";
}  // namespace QueueAttributeKeys

/// Keys of the options that go to the print system beside a QueueAttributes dictionary.
namespace QueueOptionKeys {
inline constexpr std::string_view kDisplayName = "PC WSItem User Name";  ///< the queue's name for people
}  // namespace QueueOptionKeys

}  // namespace ventras
