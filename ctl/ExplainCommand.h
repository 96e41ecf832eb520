#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// What the agent would do if it were started with these arguments.
Exit explainArguments(const Arguments& arguments, Output& output);

}  // namespace ventras
