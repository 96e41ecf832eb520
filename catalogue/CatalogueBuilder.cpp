#include "catalogue/CatalogueBuilder.h"

#include <algorithm>
#include <array>
#include <set>
#include <string_view>
#include <utility>

#include "catalogue/CatalogueFormat.h"
#include "catalogue/ScanIDKey.h"
#include "platform/PropertyList.h"

namespace ventras {
namespace {

struct Collection {
    std::string_view package;
    int tier;
};

// The generic collections, the more carefully made ones first. All other packages are made for their devices.
constexpr std::array kCollections{
    Collection{"printer-driver-gutenprint", 1},
    Collection{"foomatic-db-compressed-ppds", 2},
    Collection{"openprinting-ppds", 3},
};

// Their drivers are all in newer packages, too.
constexpr std::array<std::string_view, 3> kSuperseded{"hplip-data", "printer-driver-hpijs", "hpijs-ppds"};

int tierOf(std::string_view package) {
    const auto known = std::ranges::find(kCollections, package, &Collection::package);
    return known == kCollections.end() ? 0 : known->tier;
}

bool isSuperseded(std::string_view package) {
    return std::ranges::find(kSuperseded, package) != kSuperseded.end();
}

bool bringsAlong(const PackageContent& package, std::string_view other) {
    return std::ranges::find(package.brings, other) != package.brings.end();
}

/// The program that a package was made for: "min12xxw" of "printer-driver-min12xxw".
std::string_view programOf(std::string_view package) {
    constexpr std::string_view kPrefix = "printer-driver-";
    return package.starts_with(kPrefix) ? package.substr(kPrefix.size()) : std::string_view{};
}

/// "hpijs" is the program of the Foomatic drivers "hpijs" and "hpijs-pcl3".
bool isThrough(std::string_view program, std::string_view foomatic) {
    return !program.empty() && foomatic.starts_with(program) &&
           (foomatic.size() == program.size() || foomatic[program.size()] == '-');
}

/// The tags of one package, each device once.
class Tags {
public:
    void add(const ListedDriver& driver) {
        if (auto tag = deviceTag(driver); tag && known_.insert(scanIDKey(*tag).value_or(*tag)).second)
            tags_.push_back(*std::move(tag));
    }

    std::vector<std::string> take() {
        std::ranges::sort(tags_);
        return std::move(tags_);
    }

private:
    std::set<std::string> known_;
    std::vector<std::string> tags_;
};

/// Whose drivers they are, when another package than the one that lists them has their program.
class ForeignPrograms {
public:
    explicit ForeignPrograms(const std::vector<PackageContent>& packages) {
        for (const auto& package : packages)
            names_.insert(package.name);
        names_.insert(kSuperseded.begin(), kSuperseded.end());
    }

    /// The package with the driver's program; empty when it is the listing one's own, or nobody's.
    std::string_view owner(const ListedDriver& driver, std::string_view listing) const {
        const auto foomatic = foomaticDriver(driver);
        const auto found = std::ranges::find_if(names_, [&](const auto& name) {
            return name != listing && isThrough(programOf(name), foomatic);
        });
        return found == names_.end() ? std::string_view{} : *found;
    }

private:
    std::set<std::string, std::less<>> names_;
};

bool countsFor(const PackageContent& package, const PackageContent& listing, std::string_view owner) {
    if (owner.empty())
        return package.name == listing.name;
    return package.name == owner && bringsAlong(package, listing.name);
}

PropertyValue entryOf(const DriverPackage& package) {
    using namespace CatalogueFormat;
    PropertyDictionary entry{{std::string(kTitle), package.title},
                             {std::string(kVersion), package.version},
                             {std::string(kTier), std::int64_t{package.tier}},
                             {std::string(kTags), PropertyArray(package.tags.begin(), package.tags.end())}};
    if (package.driverless)
        entry.emplace(kDriverless, true);
    return entry;
}

/// Nobody needs a document type to read the file, and nobody shall fetch one.
std::string withoutDocumentType(std::string text) {
    const auto start = text.find("<!DOCTYPE");
    const auto end = start == std::string::npos ? start : text.find('\n', start);
    return end == std::string::npos ? text : text.erase(start, end + 1 - start);
}

}  // namespace

void CatalogueBuilder::add(PackageContent package) {
    std::erase_if(packages_, [&](const auto& known) { return known.name == package.name; });
    packages_.push_back(std::move(package));
}

DriverCatalogue CatalogueBuilder::build(const std::string& release) const {
    const ForeignPrograms programs(packages_);
    std::vector<DriverPackage> packages;
    for (const auto& package : packages_) {
        Tags tags;
        for (const auto& listing : packages_)
            for (const auto& driver : listing.drivers)
                if (countsFor(package, listing, programs.owner(driver, listing.name)))
                    tags.add(driver);
        auto list = tags.take();
        if (!list.empty() && !isSuperseded(package.name))
            packages.push_back({.name = package.name,
                                .title = package.title,
                                .version = package.version,
                                .tier = tierOf(package.name),
                                .tags = std::move(list)});
    }
    return {release, std::move(packages)};
}

std::optional<std::string> catalogueText(const DriverCatalogue& catalogue) {
    using namespace CatalogueFormat;
    PropertyDictionary packages;
    for (const auto& package : catalogue.packages())
        packages.emplace(package.name, entryOf(package));
    auto text = xmlPropertyList(PropertyDictionary{{std::string(kFormat), kNumber},
                                                   {std::string(kRelease), catalogue.release()},
                                                   {std::string(kPackages), std::move(packages)}});
    if (text)
        text = withoutDocumentType(*std::move(text));
    return text && DriverCatalogue::parse(*text).catalogue ? text : std::nullopt;
}

}  // namespace ventras
