#pragma once

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// While it lives, the temporary files of this process come into a folder of their own, where a test sees
/// which of them are left. Make it before there are threads.
class OwnTemporaryFiles {
public:
    OwnTemporaryFiles() {
        if (const char* folder = std::getenv("TMPDIR"))
            before_ = folder;
        setenv("TMPDIR", folder_.path().c_str(), 1);
    }
    ~OwnTemporaryFiles() {
        if (before_)
            setenv("TMPDIR", before_->c_str(), 1);
        else
            unsetenv("TMPDIR");
    }
    OwnTemporaryFiles(const OwnTemporaryFiles&) = delete;
    OwnTemporaryFiles& operator=(const OwnTemporaryFiles&) = delete;

    const std::filesystem::path& folder() const { return folder_.path(); }

    /// The files that nobody has deleted.
    std::vector<std::string> left() const {
        std::vector<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(folder_.path()))
            names.push_back(entry.path().filename());
        return names;
    }

private:
    TemporaryFolder folder_;
    std::optional<std::string> before_;
};

}  // namespace ventras
