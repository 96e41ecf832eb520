#pragma once

#include <optional>
#include <string>

#include "drivers/PPDRecord.h"
#include "platform/Handles.h"

namespace ventras {

class PrintToolAgentChannel;

/// Drivers that are not installed but could be: what the software-update catalogue has for a device.
/// Any thread may call; each question blocks until the agent answers.
namespace SoftwareUpdateDrivers {

/// The one driver package for a device.
/// @param vellum whether driverless-printing drivers count
/// @return absent without a device ID, without the agent, and when there is not exactly one package.
std::optional<PPDRecord> forDevice(PrintToolAgentChannel& agent, const std::optional<std::string>& deviceID,
                                   bool vellum);

/// The one driver package for the device of an open PPD, asked for under every identity that the PPD gives,
/// most exact first, until one is found. An identity that lacks one of its texts is left out.
std::optional<PPDRecord> forPPD(PrintToolAgentChannel& agent, ppd_file_t* ppd);

}  // namespace SoftwareUpdateDrivers
}  // namespace ventras
