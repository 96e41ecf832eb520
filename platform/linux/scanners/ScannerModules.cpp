#include "platform/linux/scanners/ScannerModules.h"

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <system_error>
#include <vector>

namespace ventras {
namespace {

constexpr const char* kModules = VENTRAS_SCANNER_MODULES_DIR;

std::optional<std::uint16_t> hexadecimal(std::string_view text) {
    if (!text.starts_with("0x") && !text.starts_with("0X"))
        return std::nullopt;
    text.remove_prefix(2);
    std::uint16_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value, 16);
    return error == std::errc{} && end == text.data() + text.size() ? std::optional{value} : std::nullopt;
}

// A line "usb 0x04a9 0x190d", words after it left aside.
bool namesDevice(const std::string& line, std::uint16_t vendor, std::uint16_t product) {
    std::istringstream words(line);
    std::string kind, first, second;
    words >> kind >> first >> second;
    return kind == "usb" && hexadecimal(first) == vendor && hexadecimal(second) == product;
}

bool namesDevice(const std::filesystem::path& configuration, std::uint16_t vendor, std::uint16_t product) {
    std::ifstream file(configuration);
    for (std::string line; std::getline(file, line);)
        if (namesDevice(line, vendor, product))
            return true;
    return false;
}

std::vector<std::filesystem::path> configurations(const std::filesystem::path& folder) {
    std::vector<std::filesystem::path> files;
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(folder, error))
        if (entry.path().extension() == ".conf")
            files.push_back(entry.path());
    std::ranges::sort(files);
    return files;
}

}  // namespace

ScannerModuleFolders ScannerModuleFolders::ofThisComputer() {
    const auto folder = [](const char* variable, const char* otherwise) {
        const char* value = std::getenv(variable);
        return std::filesystem::path(value != nullptr && *value != '\0' ? value : otherwise);
    };
    return {folder("VENTRAS_SCANNER_CONFIGURATION", "/etc/sane.d"),
            folder("VENTRAS_SCANNER_MODULES", kModules)};
}

std::optional<std::string> scannerModuleForUsb(std::uint16_t vendor, std::uint16_t product,
                                               const ScannerModuleFolders& folders) {
    for (const auto& configuration : configurations(folders.configuration))
        if (namesDevice(configuration, vendor, product))
            if (auto module = scannerModuleNamed(configuration.stem().string(), folders))
                return module;
    return std::nullopt;
}

std::optional<std::string> scannerModuleNamed(std::string_view name, const ScannerModuleFolders& folders) {
    const auto path = folders.modules / ("libsane-" + std::string(name) + ".so.1");
    std::error_code error;
    return std::filesystem::exists(path, error) ? std::optional{path.string()} : std::nullopt;
}

}  // namespace ventras
