#pragma once

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// A Debian package that a test builds.
struct TestPackage {
    std::string name;
    std::string version = "1.0";
    std::map<std::string, std::string> files{};  ///< path below the root to content
    std::string afterInstall{};                  ///< shell commands; may fail
    std::string more{};                          ///< lines of control data, e.g. "Depends: other"
};

using TestPackages = std::vector<TestPackage>;

/// Whether a package source is signed for.
enum class PackageTrust { Trusted, Unsigned };

/// A package manager's root of its own: apt and dpkg, real, install from a source in this folder into it, and
/// know nothing of the machine's packages. Needs no network. One thread at a time.
class PackageRoot {
public:
    explicit PackageRoot(const TestPackages& packages, PackageTrust trust = PackageTrust::Trusted);

    const std::filesystem::path& path() const { return root_; }

    /// What a program needs in its environment to manage this root's packages.
    Environment environment() const;

    /// How dpkg has a package: "ii " = installed, "iF " = half configured, "" = not at all.
    std::string stateOf(const std::string& package) const;

    /// Takes the package source away, as a network that goes down does.
    void loseSource() const;

    /// Shell commands that the package manager runs whenever it has changed something.
    void afterChanges(const std::string& commands) const;

private:
    std::string build(const TestPackage& package) const;

    TemporaryFolder folder_;
    std::filesystem::path root_;
};

}  // namespace ventras
