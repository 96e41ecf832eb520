#pragma once

#include <cstddef>
#include <vector>

#include "drivers/PPDRecord.h"

namespace ventras {

/// Driver records in the proportions of a real scheduler's catalogue: most of them with a device ID, many
/// without, some with several products, some known by their name only. The same for the same count.
std::vector<PPDRecord> syntheticCatalogue(std::size_t count);

}  // namespace ventras
