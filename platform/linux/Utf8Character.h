#pragma once

#include <string_view>

namespace ventras {

/// The character that begins a text; empty when the text is empty, or does not begin with well-formed UTF-8.
std::string_view firstUtf8Character(std::string_view text);

}  // namespace ventras
