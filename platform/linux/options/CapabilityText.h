#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// Whether a keyword or name from a printer can stand in a PPD as it is: it ends no string, comment, option
/// or line there, and it is no longer than RFC 8011 has it.
bool isHarmlessName(std::string_view name);

/// A printer's make and model for a PPD: what could end a string there is left out, blanks are collapsed, the
/// rest is cut to 80 bytes.
std::string harmlessModel(std::string_view text);

}  // namespace ventras
