#include "platform/linux/installer/InstallPlan.h"

#include <algorithm>
#include <array>
#include <utility>

#include "catalogue/PackageSelection.h"

namespace ventras {
namespace {

constexpr std::array kUnwelcome{PackageInfo::kRemoving, PackageInfo::kObsoleting, PackageInfo::kDowngrading};

InstallEnd selectionFailure(SelectionError error) {
    const auto failure = error == SelectionError::Malformed ? InstallFailure::MalformedPredicate
                                                            : InstallFailure::NamesNoDevice;
    return InstallEnd::failed(failure, std::string(describe(error)));
}

/// The packages that the catalogue has for a predicate: names and titles.
std::variant<std::vector<OfferedPackage>, InstallEnd> select(const std::filesystem::path& catalogue,
                                                             const std::string& predicate) {
    const auto reading = DriverCatalogue::read(catalogue);
    if (!reading.catalogue)
        return InstallEnd::failed(InstallFailure::NoCatalogue, reading.fault);
    const auto selection = selectPackages(*reading.catalogue, predicate);
    if (const auto* error = std::get_if<SelectionError>(&selection))
        return selectionFailure(*error);
    std::vector<OfferedPackage> selected;
    for (const auto* package : std::get<DriverCatalogue::Packages>(selection))
        selected.push_back({package->name, {}, package->title});
    if (selected.empty())
        return InstallEnd::failed(InstallFailure::NothingSelected, "no package in the catalogue fits");
    return selected;
}

const PackageID* reported(const TransactionResult& result, std::uint32_t info, const std::string& name) {
    const auto found = std::ranges::find_if(result.packages, [&](const ReportedPackage& package) {
        return package.info == info && package.id.name == name;
    });
    return found == result.packages.end() ? nullptr : &found->id;
}

// The package manager may answer with more than it was asked for, and with a package both as it is installed
// and as it could be.
InstallEnd find(const std::vector<OfferedPackage>& selected, PackageKit& packageKit, InstallPlan& plan) {
    std::vector<std::string> names;
    for (const auto& package : selected)
        names.push_back(package.name);
    const auto known = packageKit.resolve(names);
    if (!known.end.isCompleted())
        return known.end;
    for (const auto& package : selected) {
        if (const auto* available = reported(known, PackageInfo::kAvailable, package.name))
            plan.packages.push_back({*available, package.title});
        else if (reported(known, PackageInfo::kInstalled, package.name) == nullptr)
            return InstallEnd::failed(InstallFailure::UnknownPackage,
                                      "the package manager does not know the package " + package.name);
    }
    return InstallEnd::completed();
}

InstallEnd simulate(PackageKit& packageKit, InstallPlan& plan) {
    const auto simulation = packageKit.simulateInstall(plan.ids());
    if (!simulation.end.isCompleted())
        return simulation.end;
    for (const auto& [info, id] : simulation.packages) {
        if (info == PackageInfo::kUntrusted)
            return {InstallEnd::Kind::Failed, PackageKitError::kUntrusted,
                    "the package " + id.name + " does not come from a trusted source"};
        if (std::ranges::find(kUnwelcome, info) != kUnwelcome.end())
            return InstallEnd::failed(InstallFailure::WouldRemovePackages,
                                      "the package " + id.name + " would be removed or made older");
        if (info == PackageInfo::kInstalling)
            plan.arriving.push_back(id);
    }
    return InstallEnd::completed();
}

}  // namespace

std::vector<std::string> InstallPlan::names() const {
    std::vector<std::string> names;
    for (const auto& package : packages)
        names.push_back(package.id.name);
    return names;
}

std::vector<std::string> InstallPlan::ids() const {
    std::vector<std::string> ids;
    for (const auto& package : packages)
        ids.push_back(package.id.text);
    return ids;
}

std::vector<OfferedPackage> InstallPlan::offer() const {
    std::vector<OfferedPackage> offer;
    for (const auto& package : packages)
        offer.push_back({package.id.name, package.id.version, package.title});
    return offer;
}

std::variant<InstallPlan, InstallEnd> planInstall(const std::filesystem::path& catalogue,
                                                  const std::string& predicate, PackageKit& packageKit) {
    auto selected = select(catalogue, predicate);
    if (auto* end = std::get_if<InstallEnd>(&selected))
        return std::move(*end);
    InstallPlan plan;
    if (auto end = find(std::get<0>(selected), packageKit, plan); !end.isCompleted())
        return end;
    if (plan.packages.empty())
        return plan;
    if (auto end = simulate(packageKit, plan); !end.isCompleted())
        return end;
    return plan;
}

}  // namespace ventras
