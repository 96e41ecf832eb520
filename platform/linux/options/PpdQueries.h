#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Handles.h"

namespace ventras {

/// How a PPD has its printer asked for one option (Adobe's PPD specification 4.3, section 5.4).
struct PpdQuery {
    std::string option;                ///< keyword without "*"
    std::string program;               ///< PostScript that prints the choice
    std::vector<std::string> choices;  ///< what may be the answer
};

/// The queries for what may be installed in the printer: the options of the group "InstallableOptions".
std::vector<PpdQuery> installableOptionQueries(ppd_file_t* ppd);

/// The choice among the lines that a query's program printed; absent for "Unknown" and everything else.
std::optional<std::string> chosenBy(const PpdQuery& query, const std::vector<std::string>& lines);

/// A PPD's text with other default choices, by option; options without a default line get one.
std::string withDefaults(std::string_view ppd, const std::map<std::string, std::string>& choices);

}  // namespace ventras
