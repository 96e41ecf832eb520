#pragma once

#include <cstdlib>

namespace ventras {

/// Ends a fuzz target where something does not hold that has to hold for any input.
inline void require(bool holds) {
    if (!holds)
        std::abort();
}

}  // namespace ventras
