#include "fuzz/PPDChecks.h"

#include <strings.h>

#include <algorithm>
#include <array>

#include "fuzz/Require.h"
#include "platform/Utf8.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

// What names a program for the scheduler, and what begins a command line for the filter behind it.
constexpr std::array kFilters{"cupsFilter"sv, "cupsFilter2"sv, "cupsPreFilter"sv};
constexpr auto kCommands = "FoomaticRIP"sv;

template <class Check>
void forEachLine(std::string_view ppd, Check check) {
    while (!ppd.empty()) {
        const auto line = ppd.substr(0, ppd.find_first_of("\r\n"));
        check(line);
        ppd.remove_prefix(std::min(line.size() + 1, ppd.size()));
    }
}

bool isEqual(std::string_view one, std::string_view other) {
    return one.size() == other.size() && strncasecmp(one.data(), other.data(), one.size()) == 0;
}

bool isCode(std::string_view line) {
    if (!line.starts_with('*'))
        return false;
    const auto keyword = line.substr(1, line.find_first_of(" \t:/", 1) - 1);
    return std::ranges::any_of(kFilters, [&](auto filter) { return isEqual(keyword, filter); }) ||
           isEqual(keyword.substr(0, kCommands.size()), kCommands);
}

// *cupsFilter2: "source destination cost program"
bool namesStockProgram(std::string_view line) {
    if (!line.starts_with("*cupsFilter") || !line.ends_with('"'))
        return false;
    line.remove_suffix(1);
    const auto program = line.substr(line.rfind(' ') + 1);
    return !program.empty() && program.find_first_not_of("abcdefghijklmnopqrstuvwxyz-") == program.npos;
}

}  // namespace

void checkPPDText(std::string_view ppd) {
    forEachLine(ppd, [](auto line) { require(isValidUtf8(line) && !hasControlCharacters(line)); });
}

void checkStockFilters(std::string_view ppd) {
    forEachLine(ppd, [](auto line) { require(!isCode(line) || namesStockProgram(line)); });
}

void checkNoFilters(std::string_view ppd) {
    forEachLine(ppd, [](auto line) { require(!isCode(line)); });
}

}  // namespace ventras
