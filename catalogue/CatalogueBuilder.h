#pragma once

#include <optional>
#include <string>
#include <vector>

#include "catalogue/DriverCatalogue.h"
#include "catalogue/UnpackedPackage.h"

namespace ventras {

/// Makes the catalogue of a distribution release from what its packages contain.
///
/// A device is to resolve to one package wherever that is true: packages that others have superseded are left
/// out, collections rank behind drivers that were made for the device, and a driver that prints through a
/// program of another package counts for that package, if that one brings the collection along, and else for
/// none, because installing one package would not do. One thread at a time.
class CatalogueBuilder {
public:
    /// Adds a package; a later one of the same name replaces it.
    void add(PackageContent package);

    /// @param release such as "debian 12"
    DriverCatalogue build(const std::string& release) const;

private:
    std::vector<PackageContent> packages_;
};

/// A catalogue as the text of its file (docs/driver-catalogue.md).
/// @return absent when it breaks a rule of the format: it could not be read again.
std::optional<std::string> catalogueText(const DriverCatalogue& catalogue);

}  // namespace ventras
