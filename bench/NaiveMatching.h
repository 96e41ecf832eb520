#pragma once

#include <optional>
#include <string>
#include <vector>

#include "drivers/PPDRecord.h"

namespace ventras::naive {

/// The drivers that fit a device, by the same rules as matchingDrivers(), written as plainly as they read:
/// every text is lower-cased and compared anew for every driver. What the fast one is checked against and
/// measured by.
/// @return positions in the list, best driver first.
std::vector<std::size_t> matchingDrivers(const std::optional<std::string>& deviceID,
                                         const std::optional<std::string>& model,
                                         const std::optional<std::string>& product,
                                         const std::vector<PPDRecord>& list);

}  // namespace ventras::naive
