#pragma once

#include <map>
#include <optional>
#include <string>

namespace ventras {

/// What a device says of itself as keys and values, in the style of a DNS-SD TXT record (RFC 6763 section 6):
/// "usb_MFG", "usb_MDL", "UUID", "product", "pdl", "URF", "Duplex", ...; booleans are "T" and "F".
/// Keys are exact; an absent key and an empty value are two things.
using DeviceDescription = std::map<std::string, std::string, std::less<>>;

}  // namespace ventras
