#include "ctl/Help.h"

#include "ctl/Translation.h"

namespace ventras {
namespace {

constexpr std::size_t kColumn = 34;

std::string entry(std::string left, std::string_view right) {
    left.insert(0, "  ");
    if (left.size() + 2 > kColumn)
        left += "\n" + std::string(kColumn, ' ');
    else
        left.resize(kColumn, ' ');
    return left.append(right) + "\n";
}

std::string synopsis(const Command& command) {
    std::string text = command.name;
    for (const auto& option : command.options)
        text += std::string(" [--") + option.name + (option.valueName == nullptr ? "" : " ") +
                (option.valueName == nullptr ? "" : option.valueName) + "]";
    return *command.operands == '\0' ? text : text + " " + command.operands;
}

std::string optionEntries(std::span<const Option> options) {
    std::string text = "\n" + translated("Options:") + "\n";
    for (const auto& option : options)
        text += entry(std::string("--") + option.name +
                          (option.valueName == nullptr ? "" : std::string("=") + option.valueName),
                      translated(option.meaning));
    return text;
}

}  // namespace

std::string programHelp(std::span<const Command> commands, std::span<const Option> options) {
    std::string text =
        translated("Usage: ventrasctl %@", "[OPTION]... COMMAND [ARGUMENT]...") + "\n" +
        translated("Shows what the printer agent sees, decides and would do. It changes nothing.") + "\n\n" +
        translated("Commands:") + "\n";
    for (const auto& command : commands)
        text += entry(synopsis(command), translated(command.summary));
    return text + optionEntries(options) + "\n" +
           translated(
               "Exit status: 0 = done, 1 = not found, 2 = wrong usage, 3 = a service does not answer.") +
           "\n";
}

std::string commandHelp(const Command& command, std::span<const Option> options) {
    return translated("Usage: ventrasctl %@", synopsis(command)) + "\n" + translated(command.summary) + "\n" +
           optionEntries(options);
}

}  // namespace ventras
