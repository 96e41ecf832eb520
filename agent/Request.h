#pragma once

#include <span>
#include <string>
#include <vector>

#include "devices/VentrasPrinterObject.h"

namespace ventras {

class PPDManager;
struct Platform;

/// What a command line asks for.
struct Request {
    std::vector<DevicePtr>
        devices;  ///< those that the arguments describe, in order, then those found on the USB
    bool downloadsDrivers = true;  ///< whether missing drivers may be downloaded
    bool skerrow = false;          ///< whether missing drivers are announced instead of offered
    bool namesIppUsbPrinter = false;
};

/// Turns the arguments into devices and settings, and looks for the USB printers that they want. What the
/// command line gets wrong is said on standard error. Main thread only.
/// @param arguments UTF-8, without the program's name
Request requestFromArguments(std::span<const std::string> arguments, Platform& platform, PPDManager& drivers);

}  // namespace ventras
