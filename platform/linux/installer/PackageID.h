#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// A package as PackageKit names it: "name;version;architecture;data".
struct PackageID {
    std::string text;  ///< the whole
    std::string name;
    std::string version;
    std::string architecture;

    /// @return absent when it is not of that form, is longer than 1024 bytes, or holds control characters.
    static std::optional<PackageID> parse(std::string_view text);

    /// The same package as one that is installed, or half installed.
    std::string asInstalled() const { return name + ";" + version + ";" + architecture + ";installed"; }

    bool operator==(const PackageID&) const = default;
};

}  // namespace ventras
