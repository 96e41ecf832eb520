#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// Where the scanner driver collection keeps its modules and their configuration.
struct ScannerModuleFolders {
    std::filesystem::path configuration = "/etc/sane.d";
    std::filesystem::path modules;  ///< e.g. "/usr/lib/x86_64-linux-gnu/sane"

    /// Those of this computer; VENTRAS_SCANNER_CONFIGURATION and VENTRAS_SCANNER_MODULES name others.
    static ScannerModuleFolders ofThisComputer();
};

/// Path of the module whose configuration names a USB device; absent when none does, or it is not installed.
/// Any thread may call; it reads files.
std::optional<std::string> scannerModuleForUsb(
    std::uint16_t vendor, std::uint16_t product,
    const ScannerModuleFolders& folders = ScannerModuleFolders::ofThisComputer());

/// Path of a module by its name, e.g. "airscan"; absent when it is not installed.
std::optional<std::string> scannerModuleNamed(
    std::string_view name, const ScannerModuleFolders& folders = ScannerModuleFolders::ofThisComputer());

}  // namespace ventras
