#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

/// Reading device text in place: the keys of device IDs and TXT records are ASCII, so letters are folded as
/// ASCII, and nothing here copies or fails on bytes that are no valid UTF-8. Any thread may call.
namespace ventras::TextScan {

bool equalsIgnoringCase(std::string_view left, std::string_view right);

/// False for an empty prefix, which begins nothing.
bool startsWithIgnoringCase(std::string_view text, std::string_view prefix);

/// Where `wanted` first occurs, ignoring case; `npos` when it does not, or is empty.
std::size_t findIgnoringCase(std::string_view text, std::string_view wanted);

/// False for an empty prefix, which begins nothing.
bool startsWith(std::string_view text, std::string_view prefix);

std::string lowerCased(std::string_view text);

/// Without spaces and tabs at both ends.
std::string_view trimmed(std::string_view text);

/// Without spaces, tabs and line ends at both ends.
std::string_view trimmedOfLineEnds(std::string_view text);

/// Walks the parts of a text between separators, empty parts included; an empty separator gives one part.
class Components {
public:
    Components(std::string_view text, std::string_view separator) : rest_(text), separator_(separator) {}

    /// The next part; absent after the last.
    std::optional<std::string_view> next();

private:
    std::optional<std::string_view> rest_;
    std::string_view separator_;
};

}  // namespace ventras::TextScan
