#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// What the agent reads out of IEEE 1284 device IDs.
Exit showDeviceIDs(const Arguments& arguments, Output& output);

/// What the agent reads out of a TXT-style dictionary.
Exit showDescription(const Arguments& arguments, Output& output);

}  // namespace ventras
