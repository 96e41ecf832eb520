#pragma once

#include "drivers/PPDRecord.h"

namespace ventras {

/// Requires what holds for the record of any PPD: it is complete, it comes back from a dictionary as it went
/// in, it has a kind, and it fits a device that says what it says.
void checkRecord(const PPDRecord& record);

}  // namespace ventras
