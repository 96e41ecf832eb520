#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sysexits.h>
#include <unistd.h>

#include <chrono>
#include <mutex>

#include "platform/linux/desktop/PolkitAuthorization.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"
#include "tests/platform-linux/FakeBusService.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr auto kRight = "system.print.admin";

// Asks as an ordinary user, in a process of its own.
int ask(Environment environment) {
    for (const auto* variable : {"XDG_SESSION_ID", "WAYLAND_DISPLAY", "DISPLAY"})
        unsetenv(variable);
    environment.try_emplace("CUPS_SERVER", "/nonexistent/cups.sock");
    const auto result = runProgram({VENTRAS_TEST_ASK_POLKIT, kRight},
                                   {.environment = std::move(environment), .user = ordinaryUser()}, 30s);
    EXPECT_FALSE(result.timedOut);
    return result.exitStatus;
}

/// polkit as far as this program asks it, because a password prompt cannot be typed into here.
class Authority {
public:
    explicit Authority(const char* answer)
        : service_(
              "org.freedesktop.PolicyKit1", "/org/freedesktop/PolicyKit1/Authority",
              "org.freedesktop.PolicyKit1.Authority",
              "<method name='CheckAuthorization'><arg type='(sa{sv})' direction='in'/>"
              "<arg type='s' direction='in'/><arg type='a{ss}' direction='in'/><arg type='u' direction='in'/>"
              "<arg type='s' direction='in'/><arg type='(bba{ss})' direction='out'/></method>",
              [this, answer](const auto&, GVariant* arguments) {
                  const GTextPtr text{g_variant_print(arguments, FALSE)};
                  const std::lock_guard lock(mutex_);
                  question_ = text.get();
                  return g_variant_new_parsed(answer);
              }) {}

    std::string question() {
        const std::lock_guard lock(mutex_);
        return question_;
    }

private:
    std::mutex mutex_;
    std::string question_;
    FakeBusService service_;
};

constexpr auto kYes = "((true, false, @a{ss} {}),)";
constexpr auto kChallenge = "((false, true, @a{ss} {}),)";
constexpr auto kDismissed = "((false, false, {'polkit.dismissed': 'true'}),)";

TEST(PolkitAuthorization, GrantsWhatPolkitGrants) {
    const PrivateBus bus;
    Authority authority(kYes);
    EXPECT_EQ(ask(bus.environment()), 0);
}

TEST(PolkitAuthorization, RefusesWhatPolkitDoesNotGrant) {
    for (const auto* answer : {kChallenge, kDismissed}) {
        const PrivateBus bus;
        Authority authority(answer);
        EXPECT_EQ(ask(bus.environment()), EX_NOPERM) << answer;
    }
}

TEST(PolkitAuthorization, AsksForTheRightInTheNameOfItsProcess) {
    const PrivateBus bus;
    Authority authority(kYes);
    ask(bus.environment());
    const auto user = ordinaryUser().value_or(getuid());
    EXPECT_THAT(
        authority.question(),
        testing::MatchesRegex(
            "\\(\\('unix-process', \\{'pid': <uint32 [0-9]+>, 'start-time': <uint64 [1-9][0-9]*>, 'uid': <" +
            std::to_string(user) + ">\\}\\), 'system.print.admin', \\{\\}, 0, ''\\)"));
}

TEST(PolkitAuthorization, LetsPolkitAskTheUserInASession) {
    const PrivateBus bus;
    Authority authority(kYes);
    auto environment = bus.environment();
    environment.emplace("XDG_SESSION_ID", "1");
    EXPECT_EQ(ask(environment), 0);
    EXPECT_THAT(authority.question(), testing::HasSubstr("'system.print.admin', {}, 1, ''"));
}

TEST(PolkitAuthorization, RefusesWherePolkitDoesNotRun) {
    const PrivateBus bus;
    EXPECT_EQ(ask(bus.environment()), EX_NOPERM);
    EXPECT_EQ(ask({{"DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus"}}), EX_NOPERM);
}

TEST(PolkitAuthorization, GrantsTheOwnerOfTheSchedulerWherePolkitDoesNotRun) {
    const PrivateScheduler scheduler({.user = ordinaryUser()});
    auto environment = scheduler.environment();
    environment.emplace("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus");
    EXPECT_EQ(ask(environment), 0);
}

TEST(PolkitAuthorization, RefusesTheOwnerOfTheSchedulerWherePolkitDoes) {
    const PrivateBus bus;
    Authority authority(kChallenge);
    const PrivateScheduler scheduler({.user = ordinaryUser()});
    EXPECT_EQ(ask(together({scheduler.environment(), bus.environment()})), EX_NOPERM);
}

TEST(PolkitAuthorization, GivesUpOnAPolkitThatHangs) {
    PrivateBus bus;
    bus.suspend();
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(ask(bus.environment()), EX_NOPERM);
    EXPECT_LT(std::chrono::steady_clock::now() - start, 15s);
    bus.resume();
}

}  // namespace
}  // namespace ventras
