#pragma once

#include <cstddef>
#include <string_view>

namespace ventras {

/// Whether the bytes are well-formed UTF-8 (RFC 3629) without NUL.
bool isValidUtf8(std::string_view text);

/// Whether valid UTF-8 text holds a C0 or C1 control character or DEL.
bool hasControlCharacters(std::string_view text);

/// Number of characters (code points) in valid UTF-8 text.
std::size_t characterCount(std::string_view text);

/// The longest beginning of valid UTF-8 text of at most `bytes` bytes that cuts no character.
std::string_view truncateUtf8(std::string_view text, std::size_t bytes);

}  // namespace ventras
