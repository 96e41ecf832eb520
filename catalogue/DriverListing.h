#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// One driver that a package brings, as far as it tells which device it is for.
struct ListedDriver {
    std::string make;
    std::string makeAndModel;  ///< often with the driver's own name behind the model
    std::string deviceID;      ///< IEEE 1284 device ID; often empty

    bool operator==(const ListedDriver&) const = default;
};

/// Reads one line that a CUPS driver program prints when it is run with "list":
/// `"uri" language "make" "make and model" "device ID"`. @return absent when the line is none.
std::optional<ListedDriver> driverFromListing(std::string_view line);

/// The tag of the device that a driver is for, "MANUFACTURER:make;MODEL:model": from its device ID, and only
/// without one from its names. Any thread may call.
/// @return absent when it tells no device.
std::optional<std::string> deviceTag(const ListedDriver& driver);

/// The program that a driver of the Foomatic kind prints through, e.g. "min12xxw"; empty for other drivers.
std::string_view foomaticDriver(const ListedDriver& driver);

}  // namespace ventras
