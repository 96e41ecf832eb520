#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// A device as a backend lists it.
struct ListedDevice {
    std::string uri;
    std::string deviceID;  ///< IEEE 1284; empty when the backend does not tell it

    bool operator==(const ListedDevice&) const = default;
};

/// The devices in what a backend prints when it is called without arguments; see backend(7). Lines of another
/// form, and those for a scheme, are passed over.
std::vector<ListedDevice> listedDevices(std::string_view listing);

/// The URI by which the stock backend lists the printer of a queue.
///
/// Devices may tell one serial number on the bus and another in their device ID: the same in hexadecimal, for
/// one. The agent's URIs have that of the device ID, the stock backend's that of the bus.
/// @param uri the queue's, as stockDeviceURI() gives it
/// @return absent when no such printer is listed.
std::optional<std::string> listedURI(std::string_view uri, const std::vector<ListedDevice>& devices);

}  // namespace ventras
