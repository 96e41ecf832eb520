#pragma once

#include <filesystem>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// A PPD with these lines behind its first one, e.g. `*ModelName: "Acme"`.
std::string ppdText(const std::vector<std::string>& lines);

/// Writes a file as gzip does.
/// @return its path.
std::string writeCompressed(const TemporaryFolder& folder, std::string_view name, std::string_view content);

/// Has libcups put its temporary files into a folder of the test's own for as long as it lives.
class OwnTemporaryFiles {
public:
    OwnTemporaryFiles();
    ~OwnTemporaryFiles();

    /// The paths of all files that are there.
    std::set<std::string> paths() const;

private:
    TemporaryFolder folder_;
    std::string before_;
};

}  // namespace ventras
