#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// The first paragraph of Debian control data (Debian policy 5.1): fields under their names, of a folded
/// field the first line only. Any thread may call.
std::map<std::string, std::string, std::less<>> controlFields(std::string_view text);

/// The names in a relation such as "cups, foomatic-db-compressed-ppds | foomatic-db (>= 2)": all of them, for
/// any alternative may be the one that comes.
std::vector<std::string> packageNames(std::string_view relation);

}  // namespace ventras
