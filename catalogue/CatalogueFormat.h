#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

/// The words and bounds of a catalogue file (docs/driver-catalogue.md), for who reads it and for who writes
/// it.
namespace ventras::CatalogueFormat {

inline constexpr std::int64_t kNumber = 1;

inline constexpr std::string_view kFormat = "format";
inline constexpr std::string_view kRelease = "release";
inline constexpr std::string_view kPackages = "packages";
inline constexpr std::string_view kTitle = "title";
inline constexpr std::string_view kVersion = "version";
inline constexpr std::string_view kTier = "tier";
inline constexpr std::string_view kDriverless = "driverless";
inline constexpr std::string_view kTags = "tags";

// A distribution has some dozens of packages for some thousands of devices; a file beyond these bounds was
// not made by anybody who means well.
inline constexpr std::size_t kLongestFile = std::size_t{4} * 1024 * 1024;
inline constexpr std::size_t kMostPackages = 1000;
inline constexpr std::size_t kMostTags = 20'000;  ///< of one package
inline constexpr std::size_t kLongestText = 256;  ///< bytes
inline constexpr std::int64_t kLastTier = 9;

/// Whether a package manager can take it for a package's name (Debian policy 5.6.1), and never for an option
/// or a path.
bool isPackageName(std::string_view text);

/// Whether it is UTF-8 of a reasonable length, without control characters.
bool isPlainText(std::string_view text);

}  // namespace ventras::CatalogueFormat
