#include <gtest/gtest.h>
#include <sysexits.h>

#include <chrono>
#include <filesystem>

#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const std::filesystem::path kData = VENTRAS_TEST_DATA;
constexpr auto kPolicy = "com.quillon.print.ventrasagent.policy";
constexpr auto kRules = "com.quillon.print.ventrasagent.rules";

/// A real polkitd that knows the actions, rules and groups in a folder and none of the system's. Needs root,
/// to mount that folder over the system's own in a namespace of polkitd's.
class RealPolkit {
public:
    explicit RealPolkit(const TemporaryFolder& folder)
        : polkitd_({"unshare", "--mount", "--propagation", "private", "sh", "-ec",
                    "mount --bind \"$1/actions\" /usr/share/polkit-1/actions;"
                    "mount --bind \"$1/rules.d\" /usr/share/polkit-1/rules.d;"
                    "mount --bind \"$1/group\" /etc/group;"
                    "exec /usr/lib/polkit-1/polkitd --no-debug",
                    "sh", folder.path().string()}) {
        waitForService("org.freedesktop.PolicyKit1", polkitd_);
    }

private:
    RunningProgram polkitd_;
};

class RealPolkitTest : public testing::Test {
protected:
    RealPolkitTest() {
        std::filesystem::create_directories(folder_ / "actions");
        std::filesystem::create_directories(folder_ / "rules.d");
        std::filesystem::permissions(folder_.path(), std::filesystem::perms(0755));
        folder_.write("group", readFile("/etc/group"));
    }

    void installPolicy() {
        folder_.write(std::string("actions/") + kPolicy, readFile(kData / kPolicy));
        folder_.write(std::string("rules.d/") + kRules, readFile(kData / kRules));
    }

    int ask(const Environment& more = {{"CUPS_SERVER", "/nonexistent/cups.sock"}}) {
        return runProgram({VENTRAS_TEST_ASK_POLKIT, "system.print.admin"},
                          {.environment = together({bus_.environment(), more}), .user = ordinaryUser()}, 30s)
            .exitStatus;
    }

    TemporaryFolder folder_;
    PrivateBus bus_;
};

TEST_F(RealPolkitTest, RefusesAUserWhomNobodyCanAskForAPassword) {
    installPolicy();
    const RealPolkit polkit(folder_);
    EXPECT_EQ(ask(), EX_NOPERM);
}

TEST_F(RealPolkitTest, GrantsTheSchedulersAdministratorsByTheShippedRule) {
    installPolicy();
    folder_.write("group", "lpadmin:x:105:nobody\nnogroup:x:65534:\nroot:x:0:\n");
    const RealPolkit polkit(folder_);
    EXPECT_EQ(ask(), 0);
}

TEST_F(RealPolkitTest, FallsBackToTheSchedulersOwnerWhereTheActionIsNotInstalled) {
    const RealPolkit polkit(folder_);
    EXPECT_EQ(ask(), EX_NOPERM);
    const PrivateScheduler scheduler({.user = ordinaryUser()});
    EXPECT_EQ(ask(scheduler.environment()), 0);
}

}  // namespace
}  // namespace ventras
