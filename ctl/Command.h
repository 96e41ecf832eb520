#pragma once

#include <span>

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"

namespace ventras {

class Output;

/// One thing that the program can show.
struct Command {
    const char* name;
    const char* operands;  ///< as the help shows them
    const char* summary;
    Exit (*run)(const Arguments& arguments, Output& output);
    std::span<const Option> options = {};
    OptionOrder optionOrder = OptionOrder::Anywhere;
};

/// All commands, in the order of the help.
std::span<const Command> commands();

}  // namespace ventras
