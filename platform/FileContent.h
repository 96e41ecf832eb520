#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// Everything that a file holds. Any thread may call; it never throws for what is wrong with the file.
/// @return absent when there is no such file, the user may not read it, it is a folder, or reading fails on
/// the
///         way.
std::optional<std::string> fileContent(const std::filesystem::path& path);

/// Writes all bytes to an open file, in as many calls as that takes.
/// @return false when some could not be written; errno then says why.
bool writeAll(int descriptor, std::string_view bytes);

}  // namespace ventras
