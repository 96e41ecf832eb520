#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <iostream>
#include <string_view>

#include "tests/catalogue/CatalogueTexts.h"
#include "tests/install/InstallRun.h"
#include "tests/install/RealPackageKit.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using testing::AnyOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

const std::string kLaserJet = "MANUFACTURER:HP;MODEL:LaserJet 4";
const std::string kStylus = "MANUFACTURER:EPSON;MODEL:Stylus C80";
constexpr const char* kInstalled = "ii ";

// The installer of the platform over a real bus, polkitd, packagekitd, apt and dpkg.
class RealInstall : public testing::Test {
protected:
    RealInstall() { folder_.write("catalogue", smallCatalogue()); }

    std::string install(const std::vector<std::string>& scanIDs = {kLaserJet}) {
        return InstallRun(folder_ / "catalogue", &person_).install(scanIDs);
    }

    TemporaryFolder folder_;
    PrivateBus bus_;
    Person person_;
};

TEST_F(RealInstall, BringsThePackageAfterAYes) {
    const PackageRoot root(
        TestPackages{{.name = "laser-driver", .files = {{"usr/share/ppd/laser.ppd", "a PPD"}}}});
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install(), "completed");
    EXPECT_EQ(root.stateOf("laser-driver"), kInstalled);
    EXPECT_EQ(readFile(root.path() / "usr/share/ppd/laser.ppd"), "a PPD");
    EXPECT_THAT(person_.questions.at(0).body, HasSubstr("laser-driver 1.0"));
    EXPECT_THAT(person_.progress, Not(IsEmpty()));
}

TEST_F(RealInstall, ChangesNothingAfterANo) {
    const PackageRoot root(TestPackages{{.name = "laser-driver"}});
    const RealPackageKit packageKit(root);
    person_.answer = PromptAnswer::No;
    EXPECT_EQ(install(), "cancelled");
    EXPECT_EQ(root.stateOf("laser-driver"), "");
}

TEST_F(RealInstall, BringsWhatThePackageNeeds) {
    const PackageRoot root(
        {{.name = "laser-driver", .more = "Depends: laser-filters"}, {.name = "laser-filters"}});
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install(), "completed");
    EXPECT_EQ(root.stateOf("laser-filters"), kInstalled);
}

TEST_F(RealInstall, OfSeveralPackagesIsOne) {
    const PackageRoot root(
        TestPackages{{.name = "laser-driver"}, {.name = "ink-driver", .version = "2:3.4-1"}});
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install({kLaserJet, kStylus}), "completed");
    EXPECT_EQ(root.stateOf("laser-driver"), kInstalled);
    EXPECT_EQ(root.stateOf("ink-driver"), kInstalled);
    EXPECT_EQ(person_.questions.size(), 1U);
    EXPECT_EQ(install({kLaserJet, kStylus}), "completed");  // there already
    EXPECT_EQ(person_.questions.size(), 1U);
}

TEST_F(RealInstall, AsksForNoUnsignedPackage) {
    const PackageRoot root(TestPackages{{.name = "laser-driver"}}, PackageTrust::Unsigned);
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install(), "failed 50");
    EXPECT_EQ(root.stateOf("laser-driver"), "");
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(RealInstall, AsksForNoPackageThatLacksWhatItNeeds) {
    const PackageRoot root(TestPackages{{.name = "laser-driver", .more = "Depends: nowhere"}});
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install(), "failed 13");
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(RealInstall, AsksForNoPackageThatTheSourcesDoNotHave) {
    const PackageRoot root(TestPackages{{.name = "ink-driver"}});
    const RealPackageKit packageKit(root);
    EXPECT_EQ(install(), "failed 105");
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(RealInstall, AsksForNoPackageThatDrivesAnotherOut) {
    const PackageRoot root(
        {{.name = "laser-driver", .more = "Conflicts: ink-driver"}, {.name = "ink-driver"}});
    const RealPackageKit packageKit(root);
    ASSERT_EQ(install({kStylus}), "completed");
    EXPECT_EQ(install({kLaserJet}), "failed 110");
    EXPECT_EQ(root.stateOf("ink-driver"), kInstalled);
    EXPECT_EQ(person_.questions.size(), 1U);
}

TEST_F(RealInstall, ThatFailsHalfwayLeavesThePackageSystemWhole) {
    const PackageRoot root(
        {{.name = "laser-driver", .afterInstall = "exit 1", .more = "Depends: laser-filters"},
         {.name = "laser-filters"},
         {.name = "ink-driver"}});
    const RealPackageKit packageKit(root);
    // Which of the two depends on who notices first.
    EXPECT_THAT(install(), AnyOf("failed 16", "failed 58"));
    EXPECT_THAT(root.stateOf("laser-driver"), AnyOf("", "un ", "rc "));
    EXPECT_EQ(install({kStylus}), "completed");
    EXPECT_EQ(root.stateOf("ink-driver"), kInstalled);
}

TEST_F(RealInstall, FailsWhenTheSourceIsGoneMeanwhile) {
    const PackageRoot root(TestPackages{{.name = "laser-driver"}});
    const RealPackageKit packageKit(root);
    person_.whileThinking = [&] { root.loseSource(); };
    EXPECT_THAT(install(), testing::StartsWith("failed "));
    EXPECT_EQ(root.stateOf("laser-driver"), "");
}

// Somebody who may ask for installs, and whom nobody can ask for a password.
TEST_F(RealInstall, NeedsARight) {
    const PackageRoot root(TestPackages{{.name = "laser-driver"}});
    const RealPackageKit packageKit(root);
    std::filesystem::permissions(folder_.path(), std::filesystem::perms{0755});
    const auto asked =
        runProgram({std::filesystem::read_symlink("/proc/self/exe"), "--install", folder_ / "catalogue"},
                   {.environment = bus_.environment(), .user = ordinaryUser()});
    EXPECT_EQ(asked.standardOutput, "1 question, failed 48") << asked.standardError;
    EXPECT_EQ(root.stateOf("laser-driver"), "");
}

// For a test that needs another user: installs after a yes, and prints what came of it.
int installAndPrint(const char* catalogue) {
    Person person;
    const auto end = InstallRun(catalogue, &person).install({kLaserJet});
    std::cout << person.questions.size() << " question, " << end;
    return 0;
}

}  // namespace
}  // namespace ventras

int main(int count, char** arguments) {
    if (count == 3 && std::string_view(arguments[1]) == "--install")
        return ventras::installAndPrint(arguments[2]);
    testing::InitGoogleTest(&count, arguments);
    return RUN_ALL_TESTS();
}
