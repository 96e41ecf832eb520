#include "tests/package/HelpText.h"

#include <regex>

#include "tests/parts/Program.h"

namespace ventras {

std::string toolOutput(const std::vector<std::string>& arguments) {
    std::vector<std::string> command{VENTRAS_TOOL};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return runProgram(command, {.environment = {{"LC_ALL", "C"}, {"LANGUAGE", ""}}}).standardOutput;
}

Words toolCommands() {
    const auto help = toolOutput({"--help"});
    return matchesOf(help.substr(0, help.find("Options:")), "\n  ([a-z-]+)");
}

Words toolOptions(const std::string& command) {
    const auto help = command.empty() ? toolOutput({"--help"}) : toolOutput({command, "--help"});
    return matchesOf(help.substr(help.find("Options:")), "\n  (--[a-z-]+)");
}

Words matchesOf(const std::string& text, const std::string& expression) {
    const std::regex pattern(expression);
    Words found;
    for (std::sregex_iterator at(text.begin(), text.end(), pattern), end; at != end; ++at)
        found.insert((*at)[1]);
    return found;
}

}  // namespace ventras
