#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"
#include "ctl/Translation.h"

namespace ventras {

class Output;

inline constexpr Option kMatchOptions[] = {
    {"device-id", "S", translatable("the device's IEEE 1284 device ID")},
    {"model", "S", translatable("the device's model")},
    {"product", "S", translatable("the device's product text, e.g. \"(DeskJet 500)\"")},
    {"catalogue", "FILE",
     translatable("a JSON array of driver records, instead of the scheduler's catalogue")},
};

/// The scheduler's catalogue of drivers.
Exit showDrivers(const Arguments& arguments, Output& output);

/// The drivers that fit a device, best first, and why.
Exit showMatches(const Arguments& arguments, Output& output);

}  // namespace ventras
