#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "deviceid/PMDictionaryAdditions.h"

/// Reading IEEE 1284 device IDs ("MFG:HP;MDL:LaserJet 4;CMD:PCL,PJL;"), and the texts in the same form that
/// are made from DNS-SD TXT records ("usb_MFG:HP;..."). Keys are found ignoring case, values come back as
/// they stand; any bytes are accepted. An absent result means that the device does not say. Any thread may
/// call.
namespace ventras::PMStringAdditions {

/// The value of the first component that begins with one of the keys; white space before a key does not
/// count.
/// @param keys spellings with their ":"; their order only matters within one component
/// @return absent when no component does.
std::optional<std::string> searchStringFor(std::string_view deviceID, std::span<const std::string_view> keys);

/// searchStringFor() for one spelling.
std::optional<std::string> stringForKey(std::string_view deviceID, std::string_view key);

/// The printer languages, e.g. "PCL,PJL".
std::optional<std::string> commandSet(std::string_view deviceID);

/// The IDs of compatible devices.
std::optional<std::string> compatibleIDs(std::string_view deviceID);

/// The maker; from the product text where there is no key for it.
std::optional<std::string> make(std::string_view deviceID);

/// The model; from the product text where there is no key for it.
std::optional<std::string> model(std::string_view deviceID);

std::optional<std::string> serialNumber(std::string_view deviceID);

/// "(make model)" with the maker's name once and short, as drivers list products; empty when nothing is
/// known.
std::string product(std::string_view deviceID);

/// The name for people; "Unknown" when nothing is known.
std::string deviceName(std::string_view deviceID);

/// "MANUFACTURER:make;MODEL:model", the identifier under which driver packages are asked for; absent when
/// make or model is.
std::optional<std::string> softwareUpdateScaneID(std::string_view deviceID);

/// All components under their lower-cased keys; absent for an empty text.
std::optional<DeviceDescription> dictionaryValue(std::string_view deviceID);

/// The same for other separators. A component without a key separator is a key with an empty value; the later
/// of two equal keys stays.
/// @param keySeparator one character; with a longer one, components that contain it are left out
std::optional<DeviceDescription> dictionaryValueForKeySeperator(std::string_view text,
                                                                std::string_view keySeparator,
                                                                std::string_view componentSeparator);

/// Whether the command set names PostScript; true without a command set.
bool supportsPostscript(std::string_view deviceID);

/// Whether the command set names PCL; false without a command set.
bool supportsPCL(std::string_view deviceID);

/// Whether the device scans; true when it does not say.
bool supportsScanning(std::string_view deviceID);

/// The text in another encoding with percent-escapes (RFC 3986) for all bytes that would have a meaning in a
/// URL.
/// @param encoding IANA name of the encoding, e.g. "UTF-8", for which the bytes are taken as they stand
/// @return absent when the text is no UTF-8, cannot be written in that encoding, or the encoding is not
/// known.
std::optional<std::string> pmStringByAddingPercentEscapesUsingEncoding(std::string_view text,
                                                                       const std::string& encoding);

}  // namespace ventras::PMStringAdditions
