#include "tests/drivers/PPDText.h"

#include <cstdlib>

#include "platform/Handles.h"

namespace ventras {
namespace {

constexpr const char* kVariable = "TMPDIR";

}  // namespace

std::string ppdText(const std::vector<std::string>& lines) {
    std::string text = "*PPD-Adobe: \"4.3\"\n";
    for (const auto& line : lines)
        text += line + "\n";
    return text;
}

std::string writeCompressed(const TemporaryFolder& folder, std::string_view name, std::string_view content) {
    const auto path = (folder / name).string();
    const CupsFilePtr file{cupsFileOpen(path.c_str(), "w9")};
    cupsFileWrite(file.get(), content.data(), content.size());
    return path;
}

OwnTemporaryFiles::OwnTemporaryFiles() {
    if (const char* value = std::getenv(kVariable))
        before_ = value;
    setenv(kVariable, folder_.path().c_str(), 1);
}

OwnTemporaryFiles::~OwnTemporaryFiles() {
    if (before_.empty())
        unsetenv(kVariable);
    else
        setenv(kVariable, before_.c_str(), 1);
}

std::set<std::string> OwnTemporaryFiles::paths() const {
    std::set<std::string> paths;
    for (const auto& entry : std::filesystem::directory_iterator(folder_.path()))
        if (entry.is_regular_file())
            paths.insert(entry.path());
    return paths;
}

}  // namespace ventras
