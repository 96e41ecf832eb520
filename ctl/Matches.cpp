#include "ctl/Matches.h"

#include <array>

#include "ctl/Output.h"
#include "ctl/Records.h"
#include "ctl/Translation.h"

namespace ventras {

Array matchesFor(const DeviceToMatch& device, std::span<const PPDRecord> drivers) {
    Array matches;
    for (const auto& [index, kind, reason] : matchingDrivers(device, drivers))
        matches.push_back(Object{
            {"record", objectOf(drivers[index])}, {"kind", unsigned{kind}}, {"reason", describe(reason)}});
    return matches;
}

void printMatches(const Array& matches, Output& output) {
    if (output.isForProgram()) {
        output.printJson(matches);
        return;
    }
    Array rows;
    for (const auto& match : matches) {
        const auto& members = std::get<Object>(match);
        Object row = std::get<Object>(*find(members, "record"));
        row.insert(row.end(), members.begin() + 1, members.end());
        rows.emplace_back(std::move(row));
    }
    output.print(
        rows,
        std::array{Column{"kind", translatable("KIND")}, Column{"ppd_make_and_model", translatable("DRIVER")},
                   Column{"ppd_name", translatable("NAME")}, Column{"reason", translatable("WHY")}});
}

}  // namespace ventras
