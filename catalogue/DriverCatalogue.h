#pragma once

#include <cstddef>
#include <filesystem>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// One package of a distribution that brings printer drivers.
struct DriverPackage {
    std::string name;         ///< as the package manager knows it
    std::string title;        ///< for people
    std::string version;      ///< that the catalogue was made from
    int tier = 0;             ///< 0 = made for these devices, 1 and more = ever more generic collections
    bool driverless = false;  ///< brings drivers for driverless printing only
    std::vector<std::string>
        tags{};  ///< "MANUFACTURER:make;MODEL:model" and others, as they stand in the file

    bool operator==(const DriverPackage&) const = default;
};

/// Which packages count.
enum class PackageScope {
    DeviceDrivers,   ///< those with drivers for devices
    AlsoDriverless,  ///< those with drivers for driverless printing, too
};

struct CatalogueReading;

/// The packages of one distribution release that bring printer drivers, and the devices that they are for.
/// Immutable once read; any thread may ask.
class DriverCatalogue {
public:
    using Packages = std::vector<const DriverPackage*>;

    /// Has all packages, without being in their lists of tags.
    static constexpr std::string_view kPrintingSoftware = "printing software";

    /// Name of the catalogue's file among the program's data.
    static constexpr const char* kFileName = "driver-packages.plist";

    /// Reads a catalogue file (docs/driver-catalogue.md).
    static CatalogueReading read(const std::filesystem::path& path);

    /// The same from the file's content.
    static CatalogueReading parse(std::string_view text);

    DriverCatalogue(std::string release, std::vector<DriverPackage> packages);
    DriverCatalogue(DriverCatalogue&&) noexcept = default;
    DriverCatalogue& operator=(DriverCatalogue&&) noexcept = default;

    /// The distribution release that it is for, such as "debian 12": ID and VERSION_ID of os-release(5).
    const std::string& release() const { return release_; }

    const std::vector<DriverPackage>& packages() const { return packages_; }

    /// The best packages for a device: those of the lowest tier that has any. More than one means a conflict.
    /// @param deviceID compared by its scanIDKey()
    Packages packagesFor(std::string_view deviceID, PackageScope scope = PackageScope::DeviceDrivers) const;

    /// All packages for a device, best tier first, then by name.
    Packages candidatesFor(std::string_view deviceID, PackageScope scope = PackageScope::DeviceDrivers) const;

    /// Whether a package has a tag: "printing software", or one of its own. A tag that names a device is
    /// compared by its scanIDKey(), and only the best packages for that device have it.
    bool hasTag(const DriverPackage& package, const std::string& tag) const;

    /// How many devices it knows, and for how many of them there is exactly one best package.
    struct Coverage {
        std::size_t devices = 0;
        std::size_t resolved = 0;
    };
    Coverage coverage() const;

    /// Calls for each device that has several best packages, with its key.
    void forEachConflict(const std::function<void(const std::string& key, const Packages&)>& report) const;

private:
    std::string release_;
    std::vector<DriverPackage> packages_;
    std::map<std::string, std::vector<std::size_t>, std::less<>> byKey_;  // best tier first, then by name
    std::set<std::pair<std::size_t, std::string>> otherTags_;
};

/// What came of reading a catalogue.
struct CatalogueReading {
    std::optional<DriverCatalogue> catalogue;
    std::string fault;  ///< without a catalogue: why, naming the entry, for people
};

}  // namespace ventras
