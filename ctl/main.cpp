#include <algorithm>
#include <cstdio>
#include <exception>
#include <iostream>
#include <string>
#include <vector>

#include "ctl/Command.h"
#include "ctl/Complaint.h"
#include "ctl/Help.h"
#include "ctl/Output.h"
#include "ctl/Translation.h"

namespace {

using namespace ventras;

constexpr Option kGeneralOptions[] = {
    {"json", nullptr, translatable("print JSON, for programs")},
    {"help", nullptr, translatable("show this help and exit")},
    {"version", nullptr, translatable("show the version and exit")},
};

std::vector<Option> optionsOf(const Command& command) {
    std::vector<Option> options(command.options.begin(), command.options.end());
    options.insert(options.end(), std::begin(kGeneralOptions), std::end(kGeneralOptions));
    return options;
}

/// The answer to --help or --version, if one was asked for.
bool isAnsweredByText(const Arguments& arguments, const std::string& help) {
    if (arguments.has("help"))
        std::fputs(help.c_str(), stdout);
    else if (arguments.has("version"))
        std::puts("ventrasctl " VENTRAS_VERSION);
    else
        return false;
    return true;
}

Exit run(const Command& command, std::span<char*> arguments, Reader reader) {
    const auto options = optionsOf(command);
    const auto parsed = parseArguments(arguments, options, command.optionOrder);
    if (!parsed)
        return Exit::Usage;
    if (isAnsweredByText(*parsed, commandHelp(command, options)))
        return Exit::Success;
    Output output(parsed->has("json") ? Reader::Program : reader);
    const auto exit = command.run(*parsed, output);
    if (output.flush())
        return exit;
    complain(translated("the output could not be written"));
    return Exit::Unreachable;
}

Exit run(std::span<char*> arguments) {
    const auto general = parseArguments(arguments, kGeneralOptions, OptionOrder::BeforeOperands);
    if (!general)
        return Exit::Usage;
    if (isAnsweredByText(*general, programHelp(commands(), kGeneralOptions)))
        return Exit::Success;
    if (general->operands.empty())
        return usageError(translated("which command?"));
    const auto& name = general->operands.front();
    const auto command =
        std::ranges::find_if(commands(), [&](const Command& known) { return name == known.name; });
    if (command == commands().end())
        return usageError(translated("'%@' is no command", name));
    return run(*command, arguments.last(general->operands.size() - 1),
               general->has("json") ? Reader::Program : Reader::People);
}

}  // namespace

int main(int argc, char** argv) {
    std::ios::sync_with_stdio(false);
    try {
        const std::span<char*> all(argv, static_cast<std::size_t>(argc));
        return static_cast<int>(run(all.subspan(argc > 0 ? 1 : 0)));
    } catch (const std::exception& broken) {
        complain(broken.what());
        return static_cast<int>(Exit::Unreachable);
    }
}
