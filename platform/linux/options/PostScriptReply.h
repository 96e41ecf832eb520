#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// Reading what a PostScript printer sends back (PostScript Language Reference, section 3.8.5, and Adobe's
/// PPD specification 4.3, section 2.6). It is a device's text: any bytes are accepted. Any thread may call.
namespace ventras::PostScriptReply {

/// The lines that programs printed, without status messages ("%%[ ... ]%%"), job ends and empty lines.
std::vector<std::string> printedLines(std::string_view reply);

/// The text of a string as the operator "==" writes it: "(A \(B\))" gives "A (B)".
/// @return absent for anything else, and for text with control characters or no UTF-8.
std::optional<std::string> stringValue(std::string_view line);

}  // namespace ventras::PostScriptReply
