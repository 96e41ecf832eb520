#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// What a device ID and a driver package's tag are compared by: "maker;model", without regard to case, to the
/// number of blanks, to how the maker is spelled, and to whether the model repeats the maker.
///
/// Devices and packages go through this one function, so that a spelling can never be normalised on one side
/// only. Any thread may call.
/// @param deviceID "MANUFACTURER:HP;MODEL:LaserJet 4", or any other form of IEEE 1284 device ID
/// @return absent when the ID does not tell maker and model, or one of them is empty: it fits no package.
std::optional<std::string> scanIDKey(std::string_view deviceID);

}  // namespace ventras
