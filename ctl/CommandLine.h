#pragma once

#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// One long option. An option without a value name takes no value.
struct Option {
    const char* name;
    const char* valueName;
    const char* meaning;
};

/// What follows a command on the command line, options and operands in any order as GNU programs take them.
struct Arguments {
    std::map<std::string, std::string, std::less<>> options;  ///< the last of each name; flags have ""
    std::vector<std::string> operands;

    bool has(std::string_view option) const { return options.contains(option); }
    std::optional<std::string> value(std::string_view option) const;

    /// Whether the one operand says that the input comes line by line.
    bool areFromStandardInput() const { return operands.size() == 1 && operands.front() == "-"; }
};

/// Where options may stand.
enum class OptionOrder {
    Anywhere,
    BeforeOperands,
    AmongForeign,  ///< the operands are another program's arguments: only what is exactly a flag's name is an
                   ///< option
};

/// Reads the arguments after the program name. @return absent when they break the rules; the reason has then
/// been written to standard error. Not for two threads at once: it uses getopt.
std::optional<Arguments> parseArguments(std::span<char*> arguments, std::span<const Option> options,
                                        OptionOrder order);

}  // namespace ventras
