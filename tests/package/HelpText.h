#pragma once

#include <set>
#include <string>
#include <vector>

namespace ventras {

using Words = std::set<std::string>;

/// What ventrasctl prints for these arguments, in English.
std::string toolOutput(const std::vector<std::string>& arguments);

/// The commands that its help lists.
Words toolCommands();

/// The long options, with "--", that its help lists; with a command, those of the command.
Words toolOptions(const std::string& command = "");

/// All of the first group of an expression in a text.
Words matchesOf(const std::string& text, const std::string& expression);

}  // namespace ventras
