#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// The USB printer interfaces that are attached, with what they tell of themselves.
Exit showUsbPrinters(const Arguments& arguments, Output& output);

/// What a scanner's description says, and the PPD that a queue for it would get.
Exit showScanner(const Arguments& arguments, Output& output);

/// How driver packages for devices are asked for.
Exit showPredicate(const Arguments& arguments, Output& output);

}  // namespace ventras
