#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "catalogue/DriverListing.h"

namespace ventras {

/// What a Debian package says of itself and brings along.
struct PackageContent {
    std::string name;
    std::string version;
    std::string title;                  ///< first line of its description
    std::vector<std::string> brings{};  ///< names of packages that come with it, because it asks for them
    std::vector<ListedDriver> drivers{};
};

/// What came of looking into a folder.
struct PackageReading {
    std::optional<PackageContent> package;
    std::string fault;  ///< without a package: why, for people
};

/// Reads a folder that a package was unpacked into, its control data in DEBIAN/control ("dpkg-deb -R"). Parts
/// of the package that are in packages of their own, such as its library, may be unpacked on top of it.
///
/// Driver programs in it are run, with the argument "list", and "ppdc" for driver-information files: only for
/// packages that one would install, too.
PackageReading readUnpackedPackage(const std::filesystem::path& folder);

}  // namespace ventras
