#include "ctl/PackageOffer.h"

#include "catalogue/ScanIDKey.h"
#include "catalogue/ThisRelease.h"
#include "platform/linux/DataFolder.h"

namespace ventras {
namespace {

using Packages = DriverCatalogue::Packages;

std::vector<std::string> namesOf(const Packages& packages) {
    std::vector<std::string> names;
    for (const auto* package : packages)
        names.push_back(package->name);
    return names;
}

Array rowsOf(const Packages& packages) {
    Array rows;
    for (const auto* package : packages)
        rows.push_back(Object{{"name", package->name},
                              {"title", package->title},
                              {"version", package->version},
                              {"tier", std::int64_t{package->tier}}});
    return rows;
}

std::string reasonFor(const Packages& candidates, const Packages& best) {
    if (best.empty())
        return "no package in the catalogue is for it";
    if (best.size() > 1)
        return std::to_string(best.size()) + " packages are equally good";
    if (candidates.size() == 1)
        return "it is the only one for this device";
    return "it is made for this device more closely than " + candidates[1]->name;
}

PackageChoice offerOf(const Packages& candidates, const Packages& best) {
    return {best.size() == 1 ? std::optional{best.front()->name} : std::nullopt, reasonFor(candidates, best)};
}

}  // namespace

Object packageOffer(const DriverCatalogue& catalogue, std::string_view scanID) {
    const auto candidates = catalogue.candidatesFor(scanID);
    const auto best = catalogue.packagesFor(scanID);
    const auto offer = offerOf(candidates, best);
    return {{"scanID", scanID},
            {"key", scanIDKey(scanID)},
            {"count", static_cast<std::int64_t>(best.size())},
            {"conflicts", best.size() > 1 ? Value{namesOf(best)} : Value{}},
            {"is_cache_current", catalogue.release() == thisRelease()},
            {"packages", rowsOf(candidates)},
            {"driverPackage", offer.package},
            {"packageReason", offer.reason}};
}

PackageChoice installedPackageOffer(const std::optional<std::string>& scanID) {
    if (!scanID)
        return {std::nullopt, "the device does not tell its make and model"};
    const auto reading = installedCatalogue();
    if (!reading.catalogue)
        return {std::nullopt, reading.fault};
    return offerOf(reading.catalogue->candidatesFor(*scanID), reading.catalogue->packagesFor(*scanID));
}

CatalogueReading installedCatalogue() {
    return DriverCatalogue::read(locateDataFolder() / DriverCatalogue::kFileName);
}

}  // namespace ventras
