#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// What a network printer says of itself.
Exit showPrinter(const Arguments& arguments, Output& output);

/// What an IPP-over-USB printer says of itself in DNS-SD.
Exit showService(const Arguments& arguments, Output& output);

}  // namespace ventras
