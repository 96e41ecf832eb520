#pragma once

#include <optional>
#include <string>

#include "drivers/PPDRecord.h"

namespace ventras {

/// Reads the record of one PPD file, plain or gzip-compressed. Any thread may call.
/// @return absent when libcups cannot open it as a PPD.
std::optional<PPDRecord> parsePPDFile(const std::string& path);

/// Whether a file's first line begins as a PPD's does; compressed files are looked into.
bool beginsAsPPD(const std::string& path);

}  // namespace ventras
