#pragma once

#include <string>
#include <vector>

namespace ventras {

/// What one run of a program cost.
struct Cost {
    double milliseconds = 0;   ///< from its start to its end, as a caller sees it
    double peakMebibytes = 0;  ///< largest resident size; never below that of this process at the start
};

/// Runs a program in this one's environment, with its output thrown away and nothing around it that would
/// take time of its own.
/// @throw std::runtime_error when it does not end with status 0.
Cost timedRun(const std::vector<std::string>& arguments);

}  // namespace ventras
