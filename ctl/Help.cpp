#include "ctl/Help.h"

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
    std::string text = "\nOptions:\n";
    for (const auto& option : options)
        text += entry(std::string("--") + option.name +
                          (option.valueName == nullptr ? "" : std::string("=") + option.valueName),
                      option.meaning);
    return text;
}

}  // namespace

std::string programHelp(std::span<const Command> commands, std::span<const Option> options) {
    std::string text =
        "Usage: ventrasctl [OPTION]... COMMAND [ARGUMENT]...\n"
        "Shows what the printer agent sees, decides and would do. It changes nothing.\n"
        "\nCommands:\n";
    for (const auto& command : commands)
        text += entry(synopsis(command), command.summary);
    return text + optionEntries(options) +
           "\nExit status: 0 = done, 1 = not found, 2 = wrong usage, 3 = a service does not answer.\n";
}

std::string commandHelp(const Command& command, std::span<const Option> options) {
    return "Usage: ventrasctl " + synopsis(command) + "\n" + command.summary + "\n" + optionEntries(options);
}

}  // namespace ventras
