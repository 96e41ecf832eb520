#pragma once

#include <string>
#include <vector>

#include "tests/parts/Program.h"

namespace ventras {

/// Runs ventrasctl, which finishes within a minute.
inline ProgramResult ctl(std::vector<std::string> arguments, const ProgramOptions& options = {}) {
    arguments.insert(arguments.begin(), VENTRAS_TEST_CTL);
    return runProgram(arguments, options);
}

/// Runs ventrasctl with this on its standard input.
inline ProgramResult ctlReading(const std::string& input, std::vector<std::string> arguments) {
    return ctl(std::move(arguments), {.standardInput = input});
}

}  // namespace ventras
