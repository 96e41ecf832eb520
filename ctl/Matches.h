#pragma once

#include <span>

#include "ctl/Value.h"
#include "drivers/PPDMatching.h"

namespace ventras {

class Output;

/// The drivers that fit, best first, each as {"record", "kind", "reason"}.
Array matchesFor(const DeviceToMatch& device, std::span<const PPDRecord> drivers);

void printMatches(const Array& matches, Output& output);

}  // namespace ventras
