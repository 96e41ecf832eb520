#pragma once

#include <optional>

#include "ctl/Exit.h"

namespace ventras {

/// Complains when the print scheduler cannot be reached, and gives the status for it; absent = it can be.
std::optional<Exit> schedulerIsUnreachable();

}  // namespace ventras
