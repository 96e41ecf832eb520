#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>

#include "fuzz/FileInMemory.h"
#include "fuzz/Require.h"
#include "platform/Handles.h"
#include "platform/Utf8.h"
#include "platform/linux/options/PostScriptReply.h"
#include "platform/linux/options/PpdQueries.h"

// A printer's interpreter prints what it likes when it is asked what is installed. Of the input, what stands
// in front of the first NUL is its answer, the rest is the driver's PPD.

namespace {

using namespace ventras;

void checkLines(const std::vector<std::string>& lines) {
    for (const auto& line : lines) {
        require(!line.empty() && line.find_first_of("\r\n\x04") == line.npos && !line.starts_with("%%["));
        if (const auto text = PostScriptReply::stringValue(line))
            require(isValidUtf8(*text) && !hasControlCharacters(*text) && text->size() <= line.size() - 2);
    }
}

std::map<std::string, std::string> choicesIn(ppd_file_t* ppd, const std::vector<std::string>& lines) {
    std::map<std::string, std::string> choices;
    for (const auto& query : installableOptionQueries(ppd))
        if (const auto choice = chosenBy(query, lines)) {
            require(std::ranges::count(lines, *choice) != 0);
            require(std::ranges::count(query.choices, *choice) != 0);
            choices.insert_or_assign(query.option, *choice);
        }
    return choices;
}

// Nothing else in the PPD changes: what is left without the lines for defaults is the same.
std::string withoutDefaults(std::string_view ppd) {
    std::string text;
    while (!ppd.empty()) {
        const auto line = ppd.substr(0, ppd.find('\n'));
        if (!line.starts_with("*Default"))
            text.append(line).append("\n");
        ppd.remove_prefix(std::min(line.size() + 1, ppd.size()));
    }
    return text;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const FileInMemory file;
    const std::string_view input{reinterpret_cast<const char*>(data), size};
    const auto reply = input.substr(0, input.find('\0'));
    const auto lines = PostScriptReply::printedLines(reply);
    checkLines(lines);

    const auto ppdText = input.substr(std::min(reply.size() + 1, size));
    file.hold(ppdText);
    const PpdPtr ppd{ppdOpenFile(file.path().c_str())};
    if (!ppd)
        return 0;
    const auto choices = choicesIn(ppd.get(), lines);
    const auto changed = withDefaults(ppdText, choices);
    require(withDefaults(changed, choices) == changed);
    require(withoutDefaults(changed) == withoutDefaults(ppdText));
    for (const auto& [option, choice] : choices)
        require(changed.find("*Default" + option + ": " + choice) != changed.npos);
    return 0;
}
