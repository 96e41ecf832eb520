#include "ctl/CommandLine.h"

#include <getopt.h>

#include <algorithm>

namespace ventras {
namespace {

Arguments parseAmongForeign(std::span<char*> arguments, std::span<const Option> options) {
    Arguments parsed;
    for (const std::string argument : arguments) {
        const auto known = std::ranges::find_if(
            options, [&](const Option& option) { return argument == "--" + std::string(option.name); });
        if (known == options.end())
            parsed.operands.push_back(argument);
        else
            parsed.options.insert_or_assign(known->name, "");
    }
    return parsed;
}

}  // namespace

std::optional<std::string> Arguments::value(std::string_view option) const {
    const auto found = options.find(option);
    return found == options.end() ? std::nullopt : std::optional{found->second};
}

std::optional<Arguments> parseArguments(std::span<char*> arguments, std::span<const Option> options,
                                        OptionOrder order) {
    if (order == OptionOrder::AmongForeign)
        return parseAmongForeign(arguments, options);

    std::vector<option> table;
    for (const auto& known : options)
        table.push_back(
            {known.name, known.valueName == nullptr ? no_argument : required_argument, nullptr, 0});
    table.push_back({});

    // getopt() expects a program name, which it puts before its messages.
    static char programName[] = "ventrasctl";
    std::vector<char*> all{programName};
    all.insert(all.end(), arguments.begin(), arguments.end());
    const int count = static_cast<int>(all.size());
    all.push_back(nullptr);

    Arguments parsed;
    optind = 0;  // makes the GNU implementation start anew
    int index = 0;
    for (;;) {
        const int found = getopt_long(count, all.data(), order == OptionOrder::BeforeOperands ? "+" : "",
                                      table.data(), &index);
        if (found == -1)
            break;
        if (found != 0)
            return std::nullopt;
        parsed.options.insert_or_assign(table[static_cast<std::size_t>(index)].name,
                                        optarg == nullptr ? "" : optarg);
    }
    parsed.operands.assign(all.begin() + optind, all.begin() + count);
    return parsed;
}

}  // namespace ventras
