#pragma once

#include <string_view>

#include "ctl/Exit.h"

namespace ventras {

/// Writes "ventrasctl: message" to standard error, without what would steer a terminal.
void complain(std::string_view message);

/// Complains about how the program was called, and gives the status for it.
Exit usageError(std::string_view message);

}  // namespace ventras
