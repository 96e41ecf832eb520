#pragma once

#include <map>
#include <optional>
#include <string>

namespace ventras {

/// What a device says of itself as keys and values, in the style of a DNS-SD TXT record (RFC 6763 section 6):
/// "usb_MFG", "usb_MDL", "UUID", "product", "pdl", "URF", "Duplex", ...; booleans are "T" and "F".
/// Keys are exact; an absent key and an empty value are two things.
using DeviceDescription = std::map<std::string, std::string, std::less<>>;

/// Reading device-description dictionaries: the same questions as PMStringAdditions asks of a device ID,
/// answered the same way. The first key present wins, even with an empty value. An absent result means that
/// the device does not say. Any thread may call.
namespace PMDictionaryAdditions {

std::optional<std::string> commandSet(const DeviceDescription& description);
std::optional<std::string> compatibleIDs(const DeviceDescription& description);

/// The maker; from "product" where there is no key for it.
std::optional<std::string> make(const DeviceDescription& description);

/// The model; from "product" where there is no key for it.
std::optional<std::string> model(const DeviceDescription& description);

std::optional<std::string> serialNumber(const DeviceDescription& description);

/// "(make model)" with the maker's name once and short, as drivers list products; empty when nothing is
/// known.
std::string product(const DeviceDescription& description);

/// "MANUFACTURER:make;MODEL:model", the identifier under which driver packages are asked for; absent when
/// make or model is.
std::optional<std::string> softwareUpdateScaneID(const DeviceDescription& description);

/// Whether the command set names PostScript; true without a command set.
bool supportsPostscript(const DeviceDescription& description);

/// Whether the command set names PCL; false without a command set.
bool supportsPCL(const DeviceDescription& description);

/// Whether the device scans; false only when both "scan" and "Scan" say so.
bool supportsScanning(const DeviceDescription& description);

/// The dictionary as a device-ID text that PMStringAdditions reads, in the order of its keys.
std::string stringValue(const DeviceDescription& description);

}  // namespace PMDictionaryAdditions

}  // namespace ventras
