#include "catalogue/DriverCatalogue.h"

#include <algorithm>
#include <tuple>
#include <utility>

#include "catalogue/ScanIDKey.h"

namespace ventras {
namespace {

using Packages = DriverCatalogue::Packages;

bool isOf(const DriverPackage& package, PackageScope scope) {
    return !package.driverless || scope == PackageScope::AlsoDriverless;
}

Packages bestOf(Packages candidates) {
    const auto isWorse = [&](const DriverPackage* package) {
        return package->tier != candidates.front()->tier;
    };
    candidates.erase(std::ranges::find_if(candidates, isWorse), candidates.end());
    return candidates;
}

}  // namespace

DriverCatalogue::DriverCatalogue(std::string release, std::vector<DriverPackage> packages)
    : release_(std::move(release)), packages_(std::move(packages)) {
    std::ranges::sort(packages_, {},
                      [](const auto& package) { return std::tie(package.tier, package.name); });
    for (std::size_t i = 0; i < packages_.size(); ++i)
        for (const auto& tag : packages_[i].tags) {
            const auto key = scanIDKey(tag);
            if (!key) {
                otherTags_.emplace(i, tag);
                continue;
            }
            auto& indexes = byKey_[*key];
            if (indexes.empty() || indexes.back() != i)
                indexes.push_back(i);
        }
}

Packages DriverCatalogue::candidatesFor(std::string_view deviceID, PackageScope scope) const {
    const auto key = scanIDKey(deviceID);
    const auto known = key ? byKey_.find(*key) : byKey_.end();
    Packages candidates;
    if (known == byKey_.end())
        return candidates;
    for (const auto index : known->second)
        if (isOf(packages_[index], scope))
            candidates.push_back(&packages_[index]);
    return candidates;
}

Packages DriverCatalogue::packagesFor(std::string_view deviceID, PackageScope scope) const {
    return bestOf(candidatesFor(deviceID, scope));
}

bool DriverCatalogue::hasTag(const DriverPackage& package, const std::string& tag) const {
    if (tag == kPrintingSoftware)
        return true;
    if (scanIDKey(tag)) {
        const auto best = packagesFor(tag);
        return std::ranges::find(best, &package) != best.end();
    }
    return otherTags_.contains({static_cast<std::size_t>(&package - packages_.data()), tag});
}

DriverCatalogue::Coverage DriverCatalogue::coverage() const {
    Coverage coverage{byKey_.size(), byKey_.size()};
    forEachConflict([&](const std::string&, const Packages&) { --coverage.resolved; });
    return coverage;
}

void DriverCatalogue::forEachConflict(
    const std::function<void(const std::string& key, const Packages&)>& report) const {
    for (const auto& [key, indexes] : byKey_) {
        Packages packages;
        for (const auto index : indexes)
            packages.push_back(&packages_[index]);
        packages = bestOf(std::move(packages));
        if (packages.size() > 1)
            report(key, packages);
    }
}

}  // namespace ventras
