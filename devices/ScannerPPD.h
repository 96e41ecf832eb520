#pragma once

#include <optional>
#include <string>

namespace ventras {

/// What a scanner-only PPD says.
struct ScannerPPD {
    std::string model;
    std::string uuid;
    std::string persistentID;
    std::optional<std::string> modulePath;
    std::optional<std::string> iconPath;
    bool isShared = false;  ///< served by another computer
};

/// Writes a PPD without page sizes or filters (Adobe PPD 4.3), values as they stand. Any thread may call.
/// @return path of a new temporary file that the caller deletes; absent when it cannot be written.
std::optional<std::string> writeScannerPPD(const ScannerPPD& scanner);

}  // namespace ventras
