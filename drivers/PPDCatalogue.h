#pragma once

#include <vector>

#include "drivers/PPDRecord.h"
#include "platform/Handles.h"

/// The drivers that the local scheduler offers. Any thread may call.
namespace ventras::PPDCatalogue {

/// Asks the scheduler for all of its drivers (CUPS-Get-PPDs) but those of packed collections.
/// @return in the scheduler's order; empty when it does not answer, or refuses.
std::vector<PPDRecord> ask();

/// The records in an answer to CUPS-Get-PPDs. The scheduler's own driverless driver is left out: the print
/// system brings its own.
std::vector<PPDRecord> recordsIn(ipp_t* response);

}  // namespace ventras::PPDCatalogue
