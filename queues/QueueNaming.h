#pragma once

#include <string>
#include <string_view>

namespace ventras {

class PrintSystemService;

/// A display name that differs from others as the queue's identifier does: the name, a blank, and the suffix
/// that makes the identifier unique. The name unchanged when its plain identifier is free. Any thread may
/// call.
std::string suggestedDisplayName(PrintSystemService& printSystem, const std::string& name);

/// The name without a tag of 5 to 7 characters in square brackets at its very end, and without the white
/// space before it: network printers advertise six digits of their hardware address so.
/// @param name UTF-8
std::string stripBracketedTag(std::string_view name);

}  // namespace ventras
