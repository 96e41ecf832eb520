#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// What the agent reads out of PPD files.
Exit showPPDs(const Arguments& arguments, Output& output);

/// How the agent ranks the driver records that it is given on standard input.
Exit showKinds(const Arguments& arguments, Output& output);

}  // namespace ventras
