#include "catalogue/ControlData.h"

#include "deviceid/TextScan.h"

namespace ventras {

std::map<std::string, std::string, std::less<>> controlFields(std::string_view text) {
    std::map<std::string, std::string, std::less<>> fields;
    TextScan::Components lines(text, "\n");
    while (const auto line = lines.next()) {
        if (TextScan::trimmedOfLineEnds(*line).empty()) {
            if (fields.empty())
                continue;
            break;
        }
        const auto colon = line->find(':');
        const bool isContinued = line->starts_with(' ') || line->starts_with('\t');
        if (!isContinued && colon != std::string_view::npos)
            fields.emplace(line->substr(0, colon), TextScan::trimmedOfLineEnds(line->substr(colon + 1)));
    }
    return fields;
}

std::vector<std::string> packageNames(std::string_view relation) {
    std::vector<std::string> names;
    TextScan::Components groups(relation, ",");
    while (const auto group = groups.next()) {
        TextScan::Components alternatives(*group, "|");
        while (const auto alternative = alternatives.next()) {
            const auto name = TextScan::trimmedOfLineEnds(*alternative);
            if (!name.empty())
                names.emplace_back(name.substr(0, name.find_first_of(" :(\t")));
        }
    }
    return names;
}

}  // namespace ventras
