#pragma once

#include <string_view>

#include "platform/Handles.h"

namespace ventras {

/// A PPD as libcups reads it, and with it the scheduler and its filters. Any thread may call.
/// @param text of the whole file
/// @return null when libcups takes it for no PPD.
PpdPtr openedPpd(std::string_view text);

}  // namespace ventras
