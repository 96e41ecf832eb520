#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// The scanners and multifunction devices that are announced within a few seconds.
Exit showScanners(const Arguments& arguments, Output& output);

}  // namespace ventras
