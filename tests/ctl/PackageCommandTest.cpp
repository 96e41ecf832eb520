#include <gtest/gtest.h>

#include <sys/stat.h>

#include "ctl/Json.h"
#include "tests/catalogue/CatalogueTexts.h"
#include "tests/ctl/Answers.h"
#include "tests/ctl/Ctl.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

/// ventrasctl with the small catalogue as the installed one.
class PackageCommand : public testing::Test {
protected:
    PackageCommand() { data_.write("driver-packages.plist", smallCatalogue("other 1")); }

    ProgramResult lookUp(const std::string& id, std::vector<std::string> options = {}) const {
        options.insert(options.begin(), {"catalogue", "lookup", id});
        return ctl(options, {.environment = {{"VENTRAS_DATA_DIR", data_.path().string()}}});
    }

    TemporaryFolder data_;
};

TEST_F(PackageCommand, SaysWhichPackageIsOfferedAndWhy) {
    const auto run = lookUp("MANUFACTURER:HP;MODEL:LaserJet 4", {"--json"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(
        run.standardOutput,
        R"({"scanID":"MANUFACTURER:HP;MODEL:LaserJet 4","key":"hp;laserjet 4","count":1,"conflicts":null,)"
        R"("is_cache_current":false,"packages":[{"name":"laser-driver","title":"A driver","version":"1.0-1",)"
        R"("tier":0},{"name":"collection","title":"A driver","version":"1.0-1","tier":2}],)"
        R"("driverPackage":"laser-driver",)"
        R"("packageReason":"it is made for this device more closely than collection"})"
        "\n");
    const auto people = lookUp("MANUFACTURER:HP;MODEL:LaserJet 5");
    EXPECT_NE(people.standardOutput.find("collection is offered: it is the only one for this device.\n"),
              std::string::npos)
        << people.standardOutput;
}

TEST_F(PackageCommand, SaysWhyNoneIsOffered) {
    const auto conflict = lookUp("MANUFACTURER:HP;MODEL:LaserJet 6");
    EXPECT_EQ(conflict.exitStatus, 0);
    EXPECT_NE(conflict.standardOutput.find("None is offered: 2 packages are equally good.\n"),
              std::string::npos)
        << conflict.standardOutput;
    const auto unknown = lookUp("MANUFACTURER:HP;MODEL:none");
    EXPECT_EQ(unknown.exitStatus, 1);
    EXPECT_NE(unknown.standardOutput.find("None is offered: no package in the catalogue is for it.\n"),
              std::string::npos)
        << unknown.standardOutput;
}

TEST_F(PackageCommand, SaysWhyACatalogueCannotBeUsed) {
    const auto run = lookUp("x", {"--file", "/does/not/exist"});
    EXPECT_EQ(run.exitStatus, 3);
    EXPECT_EQ(run.standardError, "ventrasctl: /does/not/exist: there is no such file\n");
}

TEST_F(PackageCommand, IsToldItsTask) {
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"catalogue"},
                                                      {"catalogue", "other"},
                                                      {"catalogue", "lookup"},
                                                      {"catalogue", "lookup", "a", "b"},
                                                      {"catalogue", "build"}})
        EXPECT_EQ(ctl(arguments).exitStatus, 2) << testing::PrintToString(arguments);
}

/// A folder with an unpacked package that has a driver for an Acme X1.
class UnpackedAcme : public testing::Test {
protected:
    UnpackedAcme() {
        folder_.write("acme/DEBIAN/control", "Package: acme\nVersion: 1\nDescription: for Acme\n");
        const auto program = folder_.write("acme/usr/lib/cups/driver/acme",
                                           "#!/bin/sh\necho '\"acme:1\" en \"Acme\" \"Acme X1\" \"\"'\n");
        EXPECT_EQ(chmod(program.c_str(), 0755), 0);
    }

    std::string path(std::string_view name) const { return (folder_ / name).string(); }

    TemporaryFolder folder_;
};

TEST_F(UnpackedAcme, BecomesACatalogueThatCanBeLookedUpIn) {
    const auto run = ctl(
        {"catalogue", "build", "--json", "--release", "other 2", "--output", path("c.plist"), path("acme")});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_TRUE(run.standardOutput.starts_with(
        R"({"release":"other 2","packages":1,"tags":1,"devices":1,"resolved":1,"conflicts":[],"bytes":)"))
        << run.standardOutput;
    const auto found =
        ctl({"catalogue", "lookup", "--json", "--file", path("c.plist"), "MFG:ACME;MDL:Acme X1"});
    EXPECT_NE(found.standardOutput.find(R"("driverPackage":"acme")"), std::string::npos)
        << found.standardOutput;
    const auto shown = ctl({"catalogue", "build", path("acme")});
    EXPECT_EQ(shown.exitStatus, 0) << shown.standardError;
    EXPECT_NE(shown.standardOutput.find("devices    1\n"), std::string::npos) << shown.standardOutput;
}

TEST_F(UnpackedAcme, LeavesNoCatalogueWhenSomethingIsWrong) {
    EXPECT_EQ(
        ctl({"catalogue", "build", "--output", path("c.plist"), path("acme"), path("absent")}).exitStatus, 1);
    EXPECT_EQ(ctl({"catalogue", "build", "--output", path("c.plist"), "--release", "a\nb", path("acme")})
                  .exitStatus,
              1);
    EXPECT_FALSE(std::filesystem::exists(path("c.plist")));
    const auto run = ctl({"catalogue", "build", "--output", path("absent/c.plist"), path("acme")});
    EXPECT_EQ(run.exitStatus, 3);
    EXPECT_EQ(run.standardError, "ventrasctl: " + path("absent/c.plist") + ": cannot be written\n");
}

}  // namespace
}  // namespace ventras
