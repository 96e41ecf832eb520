#include "platform/linux/options/PpdQueries.h"

#include <algorithm>
#include <span>
#include <utility>

namespace ventras {
namespace {

constexpr std::string_view kInstallableOptions = "InstallableOptions";
constexpr std::string_view kDefault = "*Default";

template <class Item>
std::span<Item> items(Item* first, int count) {
    return {first, static_cast<std::size_t>(std::max(count, 0))};
}

/// The option that a line sets the default of; empty for other lines.
std::string_view defaultOption(std::string_view line) {
    if (!line.starts_with(kDefault))
        return {};
    return line.substr(kDefault.size(), line.find(':') - kDefault.size());
}

}  // namespace

std::vector<PpdQuery> installableOptionQueries(ppd_file_t* ppd) {
    std::vector<PpdQuery> queries;
    for (const auto& group : items(ppd->groups, ppd->num_groups)) {
        if (group.name != kInstallableOptions)
            continue;
        for (const auto& option : items(group.options, group.num_options)) {
            const auto* attribute = ppdFindAttr(ppd, ("?" + std::string(option.keyword)).c_str(), nullptr);
            if (attribute == nullptr || attribute->value == nullptr || *attribute->value == '\0')
                continue;
            PpdQuery query{option.keyword, attribute->value, {}};
            for (const auto& choice : items(option.choices, option.num_choices))
                query.choices.emplace_back(choice.choice);
            queries.push_back(std::move(query));
        }
    }
    return queries;
}

std::optional<std::string> chosenBy(const PpdQuery& query, const std::vector<std::string>& lines) {
    const auto answer = std::find_if(lines.rbegin(), lines.rend(), [&](const auto& line) {
        return std::ranges::find(query.choices, line) != query.choices.end();
    });
    return answer == lines.rend() ? std::nullopt : std::optional{*answer};
}

std::string withDefaults(std::string_view ppd, const std::map<std::string, std::string>& choices) {
    std::string text;
    std::map<std::string, std::string, std::less<>> missing(choices.begin(), choices.end());
    const auto append = [&](std::string_view option, std::string_view choice, std::string_view lineEnd) {
        text.append(kDefault).append(option).append(": ").append(choice).append(lineEnd);
    };
    while (!ppd.empty()) {
        const auto end = ppd.find('\n');
        const auto length = end == ppd.npos ? ppd.size() : end + 1;
        const auto line = ppd.substr(0, length);
        const auto choice = choices.find(std::string(defaultOption(line)));
        if (choice == choices.end()) {
            text += line;
        } else {
            append(choice->first, choice->second, line.ends_with("\r\n") ? "\r\n" : "\n");
            missing.erase(choice->first);
        }
        ppd.remove_prefix(length);
    }
    if (!missing.empty() && !text.ends_with('\n'))
        text += '\n';
    for (const auto& [option, choice] : missing)
        append(option, choice, "\n");
    return text;
}

}  // namespace ventras
