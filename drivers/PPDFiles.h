#pragma once

#include <optional>
#include <string>

namespace ventras {

struct PPDRecord;
class PrintSystemService;

/// Copies of PPD files, wherever they come from. Every path that comes back is a new temporary file, which
/// the caller deletes; after a failure none is left. Any thread may call.
namespace PPDFiles {

/// Copies a local PPD, decompressed.
/// @return absent when the path is, or when the file cannot be read to its end: a truncated, damaged or empty
///         gzip file, what is no regular file, what is too large for a PPD.
std::optional<std::string> copyOf(const std::optional<std::string>& path);

/// Fetches a driver's PPD: a file of this computer, or from the scheduler (CUPS-Get-PPD).
std::optional<std::string> fetch(const PPDRecord& record, PrintSystemService& printSystem);

}  // namespace PPDFiles
}  // namespace ventras
