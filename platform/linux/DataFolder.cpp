#include "platform/linux/DataFolder.h"

#include <cstdlib>
#include <system_error>

namespace ventras {
namespace {

constexpr const char* kOverride = "VENTRAS_DATA_DIR";

// Programs stand beside "share", below an installation's prefix and below a build folder.
std::filesystem::path besideTheProgram() {
    std::error_code error;
    const auto program = std::filesystem::read_symlink("/proc/self/exe", error);
    return error ? std::filesystem::path{} : program.parent_path().parent_path() / "share" / "ventrasagent";
}

bool isPlainName(std::string_view name) {
    return !name.empty() && name.find('/') == std::string_view::npos &&
           name.find('\0') == std::string_view::npos;
}

}  // namespace

std::filesystem::path locateDataFolder() {
    if (const char* folder = std::getenv(kOverride); folder != nullptr && *folder != '\0')
        return folder;
    std::error_code error;
    if (const auto folder = besideTheProgram(); std::filesystem::is_directory(folder, error))
        return folder;
    return VENTRAS_INSTALLED_DATA_DIR;
}

std::optional<std::string> DataFolder::pathForResource(std::string_view name, std::string_view type) const {
    if (!isPlainName(name) || !isPlainName(type))
        return std::nullopt;
    const auto path = folder_ / (std::string(name) + "." + std::string(type));
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error))
        return std::nullopt;
    return path.string();
}

}  // namespace ventras
