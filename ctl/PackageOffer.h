#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "catalogue/DriverCatalogue.h"
#include "ctl/Value.h"

namespace ventras {

/// What the catalogue of driver packages says of one device: "scanID", "key", "count", "conflicts" (null, or
/// the names of several packages that are equally good), "is_cache_current", all its "packages" with best
/// ones first, the one that would be offered as "driverPackage", and the "packageReason" why, or why none.
Object packageOffer(const DriverCatalogue& catalogue, std::string_view scanID);

/// The package that would be offered.
struct PackageChoice {
    std::optional<std::string> package;  ///< absent: none
    std::string reason;                  ///< why this one, or why none
};

/// What would be offered from the installed catalogue.
/// @param scanID absent for a device that does not tell its make and model
PackageChoice installedPackageOffer(const std::optional<std::string>& scanID);

/// The catalogue that comes with this system.
CatalogueReading installedCatalogue();

}  // namespace ventras
