#include <gtest/gtest.h>

#include "tests/scripts/ScriptsFolder.h"

namespace ventras {
namespace {

// Two packages are there, one was removed but for its settings.
constexpr std::string_view kInstalled =
    "printf 'installed cups\\ninstalled libcups2-dev\\nconfig-files ghostscript\\n'";
constexpr std::string_view kRecord = "echo \"$0 $*\" | sed 's,.*/,,' >> \"$HOME/commands.log\"";

class Packages : public testing::Test {
protected:
    Packages() {
        folder_.replaceCommand("dpkg-query", kInstalled);
        folder_.replaceCommand("apt-get", kRecord);
    }

    std::string commands() const { return readFile(folder_.home() / "commands.log"); }

    ScriptsFolder folder_;
};

TEST_F(Packages, AreMissingUnlessTheyAreFullyInstalled) {
    const auto result = folder_.runWithParts("missing_of libcups2-dev ghostscript cups cmake libcups2");
    EXPECT_EQ(result.standardOutput, "cmake\nghostscript\nlibcups2\n") << result.standardError;
}

TEST_F(Packages, AreListedByWhatNeedsThem) {
    const auto result = folder_.runWithParts("packages_of run");
    EXPECT_NE(result.standardOutput.find("cups-client\n"), std::string::npos) << result.standardOutput;
    EXPECT_EQ(result.standardOutput.find("cmake"), std::string::npos) << result.standardOutput;
    EXPECT_EQ(result.standardOutput.find('['), std::string::npos) << result.standardOutput;
}

TEST_F(Packages, AreNamedOnceAndInOrderInEachSection) {
    const auto result = folder_.runWithParts(
        "for s in build run test kernel package ci; do packages_of $s | LC_ALL=C sort -uc && "
        "packages_of $s | grep -q .; done");
    EXPECT_EQ(result.exitStatus, 0) << result.standardError;
}

TEST_F(Packages, LeaveAptAloneWhenNothingIsMissing) {
    folder_.replaceCommand("dpkg-query",
                           "sed -n 's/^[a-z].*/installed &/p' \"$(dirname \"$0\")/../scripts/packages\"");
    const auto result = folder_.runWithParts("install_missing build run test ci");
    EXPECT_EQ(result.exitStatus, 0) << result.standardError;
    EXPECT_EQ(commands(), "");
}

TEST_F(Packages, AreInstalledWithoutAQuestion) {
    folder_.replaceCommand("sudo", std::string(kRecord) + "; exec \"$@\"");
    const auto result = folder_.runWithParts("install_missing run");
    EXPECT_EQ(result.exitStatus, 0) << result.standardError;
    EXPECT_NE(commands().find("apt-get -qq -o DPkg::Lock::Timeout=300 update\n"), std::string::npos)
        << commands();
    EXPECT_NE(commands().find(
                  "install -y --no-install-recommends cups-client cups-filters cups-ipp-utils ghostscript\n"),
              std::string::npos)
        << commands();
}

TEST_F(Packages, AreStillInstalledWhenTheListsCannotBeRenewed) {
    folder_.replaceCommand("sudo", "exec \"$@\"");
    folder_.replaceCommand("apt-get", std::string(kRecord) + "; case \"$*\" in *update) exit 100;; esac");
    const auto result = folder_.runWithParts("install_missing run");
    EXPECT_EQ(result.exitStatus, 0) << result.standardError;
    EXPECT_NE(commands().find("install -y"), std::string::npos) << commands();
}

TEST_F(Packages, ThatCannotBeInstalledEndTheScript) {
    folder_.replaceCommand("sudo", "exec \"$@\"");
    folder_.replaceCommand("apt-get", "exit 100");
    const auto result = folder_.runWithParts("install_missing run; echo went on");
    EXPECT_EQ(result.exitStatus, 1);
    EXPECT_EQ(result.standardOutput, "");
    EXPECT_NE(result.standardError.find("apt could not install: cups-client"), std::string::npos)
        << result.standardError;
}

}  // namespace
}  // namespace ventras
