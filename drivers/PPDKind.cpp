#include "drivers/PPDKind.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "deviceid/TextScan.h"

namespace ventras::PPDKind {
namespace {

/// How the names of drivers that are installed on this computer begin.
constexpr std::array<std::string_view, 10> kInstalledPrefixes{
    "/",
    "drv:///Library",
    "drvr:///Library",
    "quillon://Scanner",
    "Library/Printers",
    "file://Library/Printers",
    "file:///Library/Printers",
    "System/Library/Printers/PPDs",
    "file://System/Library/Printers/PPDs",
    "file:///System/Library/Printers/PPDs",
};

constexpr std::string_view kTiogaFilter = "application/Tioga 0 -";

bool isInstalled(std::string_view name) {
    return std::ranges::any_of(kInstalledPrefixes, [&](auto prefix) { return name.starts_with(prefix); });
}

bool mentionsHpijs(std::string_view name) {
    return TextScan::findIgnoringCase(name, "hpijs") != std::string_view::npos;
}

}  // namespace

Kind of(const PPDRecord& record) {
    if (record.suDriverPredicate)
        return record.suDriverConflicts ? kSoftwareUpdateWithConflicts : kSoftwareUpdate;
    if (std::ranges::find(record.filters, kTiogaFilter) != record.filters.end())
        return kTioga;
    if (record.secureVellum == true)
        return kSecureDriverless;

    const std::string_view name = record.name ? std::string_view(*record.name) : std::string_view();
    if (name.ends_with("Vellum.ppd"))
        return kDriverless;
    const bool localized = record.naturalLanguage && !record.naturalLanguage->empty();
    if (!isInstalled(name))
        return localized ? kServerLocalized : kServer;
    if (mentionsHpijs(name))
        return kInstalledHpijs;
    return localized ? kInstalledLocalized : kInstalled;
}

}  // namespace ventras::PPDKind
