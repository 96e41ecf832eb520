#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// How the free-text values of a PPD are encoded.
enum class TextEncoding { UTF8, ISOLatin1, WindowsCP1252, ShiftJIS };

/// The encoding behind a PPD's `LanguageEncoding`, which is compared exactly; UTF-8 for every other value.
TextEncoding textEncodingNamed(std::string_view languageEncoding);

/// The bytes as UTF-8.
/// @return absent when they are malformed in that encoding, or the system has no converter for it.
std::optional<std::string> decoded(std::string_view bytes, TextEncoding encoding);

}  // namespace ventras
