#pragma once

#include <span>
#include <string>

#include "ctl/Command.h"

namespace ventras {

/// What --help prints: the commands and the options that all of them take.
std::string programHelp(std::span<const Command> commands, std::span<const Option> options);

/// What --help prints behind a command.
std::string commandHelp(const Command& command, std::span<const Option> options);

}  // namespace ventras
