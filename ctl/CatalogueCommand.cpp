#include "ctl/CatalogueCommand.h"

#include <array>
#include <variant>

#include "ctl/Complaint.h"
#include "ctl/Json.h"
#include "ctl/LineByLine.h"
#include "ctl/Matches.h"
#include "ctl/Output.h"
#include "ctl/Records.h"
#include "ctl/SchedulerCheck.h"
#include "ctl/Translation.h"
#include "drivers/PPDCatalogue.h"
#include "platform/FileContent.h"

namespace ventras {
namespace {

using Records = std::vector<PPDRecord>;

std::variant<Records, Exit> catalogueFromFile(const std::string& path) {
    const auto text = fileContent(path);
    if (!text) {
        complain(translated("%@: cannot be read", path));
        return Exit::NotFound;
    }
    auto records = recordsFromJson(*text);
    if (!records)
        return usageError(translated("%@: no JSON array of driver records", path));
    return *std::move(records);
}

std::variant<Records, Exit> catalogue(const Arguments& arguments) {
    if (const auto path = arguments.value("catalogue"))
        return catalogueFromFile(*path);
    if (const auto unreachable = schedulerIsUnreachable())
        return *unreachable;
    return PPDCatalogue::ask();
}

/// A device as one line of input describes it: any of three texts.
std::optional<DeviceToMatch> deviceFromJson(const std::string& line) {
    const auto value = parseJson(line);
    const auto* object = value ? std::get_if<Object>(&*value) : nullptr;
    if (object == nullptr)
        return std::nullopt;
    std::array<DeviceToMatch::Text, 3> texts;
    constexpr std::array kKeys{"deviceID", "model", "product"};
    for (std::size_t i = 0; i < kKeys.size(); ++i) {
        const auto* member = find(*object, kKeys[i]);
        if (member == nullptr || member->isNull())
            continue;
        const auto* text = std::get_if<std::string>(member);
        if (text == nullptr)
            return std::nullopt;
        texts[i] = *text;
    }
    return DeviceToMatch(texts[0], texts[1], texts[2]);
}

}  // namespace

Exit showDrivers(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty())
        return usageError(translated("drivers: takes no operand"));
    const auto drivers = catalogue(arguments);
    if (const auto* exit = std::get_if<Exit>(&drivers))
        return *exit;
    Array rows;
    for (const auto& driver : std::get<Records>(drivers))
        rows.emplace_back(objectOf(driver));
    output.print(rows, std::array{Column{"ppd_make_and_model", translatable("DRIVER")},
                                  Column{"ppd_name", translatable("NAME")}});
    return Exit::Success;
}

Exit showMatches(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty() && !arguments.areFromStandardInput())
        return usageError(translated("match: the device is described by options"));
    const auto list = catalogue(arguments);
    if (const auto* exit = std::get_if<Exit>(&list))
        return *exit;
    const auto& drivers = std::get<Records>(list);

    if (arguments.areFromStandardInput())
        return answerLines(output, [&](const std::string& line) -> std::optional<Value> {
            const auto device = deviceFromJson(line);
            return device ? std::optional<Value>{matchesFor(*device, drivers)} : std::nullopt;
        });

    const auto matches = matchesFor(
        {arguments.value("device-id"), arguments.value("model"), arguments.value("product")}, drivers);
    printMatches(matches, output);
    return matches.empty() ? Exit::NotFound : Exit::Success;
}

}  // namespace ventras
