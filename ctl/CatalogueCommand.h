#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

inline constexpr Option kMatchOptions[] = {
    {"device-id", "S", "the device's IEEE 1284 device ID"},
    {"model", "S", "the device's model"},
    {"product", "S", "the device's product text, e.g. \"(DeskJet 500)\""},
    {"catalogue", "FILE", "a JSON array of driver records, instead of the scheduler's catalogue"},
};

/// The scheduler's catalogue of drivers.
Exit showDrivers(const Arguments& arguments, Output& output);

/// The drivers that fit a device, best first, and why.
Exit showMatches(const Arguments& arguments, Output& output);

}  // namespace ventras
