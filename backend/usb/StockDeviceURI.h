#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// The URI by which CUPS's stock "usb" backend knows the printer of a queue that the agent made.
///
/// The agent's URIs hold make and model as the device tells them, and where the device sits when it tells no
/// serial number. The stock backend compares URIs as texts, with its own: makes in short, models without the
/// make, no location. Given another URI than theirs it waits for ever. Its own URIs stay as they are.
/// @param uri a queue's device URI of any scheme
/// @return the same text where there is nothing to change.
std::string stockDeviceURI(std::string_view uri);

/// A part of a URI without its percent codes. Percent signs that no two digits follow stand for themselves.
std::string percentDecoded(std::string_view text);

}  // namespace ventras
