#pragma once

#include <filesystem>
#include <string>
#include <variant>
#include <vector>

#include "platform/linux/installer/InstallEnd.h"
#include "platform/linux/installer/InstallQuestion.h"
#include "platform/linux/installer/PackageKit.h"

namespace ventras {

/// A package of the catalogue that is not installed, as the package manager has it.
struct PlannedPackage {
    PackageID id;
    std::string title;
};

/// What an install would do.
struct InstallPlan {
    std::vector<PlannedPackage> packages{};  ///< none: everything is there already
    std::vector<PackageID> arriving{};       ///< everything that would be new, what these need included

    std::vector<std::string> names() const;
    std::vector<std::string> ids() const;
    std::vector<OfferedPackage> offer() const;
};

/// Finds out what an install would do, without doing anything: which packages the predicate selects in the
/// catalogue, which of them are to be had, and what would come and go with them. Called on the package
/// manager's thread.
/// @param catalogue file of the driver packages (docs/driver-catalogue.md)
/// @return the plan; or why there is none: because a package does not come from a trusted source, for one, or
///         because others would have to go
std::variant<InstallPlan, InstallEnd> planInstall(const std::filesystem::path& catalogue,
                                                  const std::string& predicate, PackageKit& packageKit);

}  // namespace ventras
