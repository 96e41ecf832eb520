#include "tests/install/PackageRoot.h"

#include <fstream>
#include <memory>
#include <stdexcept>

#include "platform/linux/ReleaseWith.h"
#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

std::string aptConfiguration(const std::string& folder) {
    const auto root = folder + "/root";
    std::string text = "Dir \"" + root + "\"; Dir::State \"" + root +
                       "/var/lib/apt\"; Dir::State::status \"" + root +
                       "/var/lib/dpkg/status\"; Dir::Cache \"" + root + "/var/cache/apt\"; Dir::Etc \"" +
                       root + "/etc/apt\"; Dir::Log \"" + root + "/var/log/apt\";\n";
    text += "Dir::Bin::methods \"/usr/lib/apt/methods\"; Dir::Bin::dpkg \"/usr/bin/dpkg\";\n";
    text += "APT::Sandbox::User \"root\"; Acquire::Languages \"none\";\n";
    text += "DPkg::Options:: \"--root=" + root + "\"; DPkg::Options:: \"--force-script-chrootless\";\n";
    text += "DPkg::Options:: \"--force-unsafe-io\";\n";
    return text +
           "#clear DPkg::Pre-Install-Pkgs; #clear DPkg::Post-Invoke; #clear APT::Update::Post-Invoke;\n"
           "#clear APT::Update::Post-Invoke-Success;\n";
}

std::string checksum(const std::string& content) {
    const GTextPtr sum{g_compute_checksum_for_string(G_CHECKSUM_SHA256, content.data(),
                                                     static_cast<gssize>(content.size()))};
    return sum.get();
}

std::string now() {
    const std::unique_ptr<GDateTime, ReleaseWith<g_date_time_unref>> time{g_date_time_new_now_utc()};
    const GTextPtr text{g_date_time_format(time.get(), "%a, %d %b %Y %H:%M:%S +0000")};
    return text.get();
}

void require(const std::vector<std::string>& command, const Environment& environment = {}) {
    const auto result = runProgram(command, {.environment = environment});
    if (result.exitStatus != 0)
        throw std::runtime_error(command.front() + ": " + result.standardOutput + result.standardError);
}

}  // namespace

PackageRoot::PackageRoot(const TestPackages& packages, PackageTrust trust) : root_(folder_ / "root") {
    for (const char* folder :
         {"etc/apt/sources.list.d", "etc/apt/preferences.d", "etc/apt/apt.conf.d", "etc/apt/trusted.gpg.d",
          "var/lib/apt/lists/partial", "var/lib/dpkg/info", "var/lib/dpkg/updates", "var/lib/dpkg/triggers",
          "var/cache/apt/archives/partial", "var/log/apt"})
        fs::create_directories(root_ / folder);
    folder_.write("root/var/lib/dpkg/status", "");
    folder_.write("apt.conf", aptConfiguration(folder_.path().string()));
    const auto source = folder_ / "source";
    fs::create_directories(source);
    std::string index;
    for (const auto& package : packages)
        index += build(package);
    folder_.write("source/Packages", index);
    folder_.write("source/Release", "Suite: test\nDate: " + now() + "\nSHA256:\n " + checksum(index) + " " +
                                        std::to_string(index.size()) + " Packages\n");
    const auto option = trust == PackageTrust::Trusted ? "[trusted=yes] "s : ""s;
    folder_.write("root/etc/apt/sources.list", "deb " + option + "file:" + source.string() + " ./\n");
    require({"apt-get", "update", "-o", "Acquire::AllowInsecureRepositories=true"}, environment());
}

Environment PackageRoot::environment() const {
    return {{"APT_CONFIG", (folder_ / "apt.conf").string()}};
}

// Builds it into the source. @return its entry in the source's index.
std::string PackageRoot::build(const TestPackage& package) const {
    const auto tree = "build/" + package.name;
    const auto control =
        "Package: " + package.name + "\nVersion: " + package.version +
        "\nArchitecture: all\nMaintainer: Test <test@example.org>\nDescription: " + package.name +
        " of a test\n" + (package.more.empty() ? "" : package.more + "\n");
    folder_.write(tree + "/DEBIAN/control", control);
    for (const auto& [path, content] : package.files)
        folder_.write(tree + "/" + path, content);
    if (!package.afterInstall.empty())
        fs::permissions(folder_.write(tree + "/DEBIAN/postinst", "#!/bin/sh\n" + package.afterInstall + "\n"),
                        fs::perms{0755});
    const auto file = package.name + ".deb";
    require({"dpkg-deb", "--root-owner-group", "-Znone", "-b", folder_ / tree, folder_ / ("source/" + file)});
    const auto content = readFile(folder_ / ("source/" + file));
    return control + "Filename: ./" + file + "\nSize: " + std::to_string(content.size()) +
           "\nSHA256: " + checksum(content) + "\n\n";
}

std::string PackageRoot::stateOf(const std::string& package) const {
    return runProgram({"dpkg-query", "--admindir=" + (root_ / "var/lib/dpkg").string(), "-W", "-f",
                       "${db:Status-Abbrev}", package})
        .standardOutput;
}

void PackageRoot::loseSource() const {
    fs::remove_all(folder_ / "source");
}

void PackageRoot::afterChanges(const std::string& commands) const {
    folder_.write("after-changes", "#!/bin/sh\n" + commands + "\n");
    std::ofstream(folder_ / "apt.conf", std::ios::app)
        << "DPkg::Post-Invoke:: \"sh " << (folder_ / "after-changes").string() << "\";\n";
}

}  // namespace ventras
