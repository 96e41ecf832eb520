#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <stop_token>

#include "platform/linux/installer/NotificationPrompter.h"
#include "tests/install/ScriptedNotifications.h"
#include "tests/install/StopSoon.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Pair;
using testing::UnorderedElementsAre;
using Clock = std::chrono::steady_clock;

const InstallQuestion kQuestion{"Install it?", "A driver (driver 1.0)\nLaser <4> & more", "Install",
                                "Not Now", "printer"};

// One prompter on a bus of its own.
class Notification : public testing::Test {
protected:
    PromptAnswer ask(std::chrono::milliseconds limit = 5s) {
        return prompter_.ask(kQuestion, Deadline::after(limit));
    }

    PrivateBus bus_;
    std::stop_source stop_;
    EventContext events_{stop_.get_token()};
    NotificationPrompter prompter_{events_};
};

TEST_F(Notification, ThatIsAnsweredYesIsAYes) {
    ScriptedNotifications service(ScriptedNotifications::pressing("install"));
    EXPECT_EQ(ask(), PromptAnswer::Yes);
}

TEST_F(Notification, ThatIsAnsweredNoIsANoAndTakenAway) {
    ScriptedNotifications service(ScriptedNotifications::pressing("cancel"));
    EXPECT_EQ(ask(), PromptAnswer::No);
    EXPECT_EQ(service.takenAway().size(), 1U);
}

TEST_F(Notification, HasTwoButtonsAndStaysUntilItIsAnswered) {
    ScriptedNotifications service(ScriptedNotifications::pressing("cancel"));
    ask();
    const auto shown = service.shown().at(0);
    EXPECT_EQ(shown.title, "Install it?");
    EXPECT_EQ(shown.body, "A driver (driver 1.0)\nLaser <4> & more");
    EXPECT_EQ(shown.icon, "printer");
    EXPECT_THAT(shown.buttons, UnorderedElementsAre(Pair("install", "Install"), Pair("cancel", "Not Now")));
    EXPECT_EQ(shown.timeLimit, 0);
    EXPECT_THAT(shown.hints, AllOf(HasSubstr("'urgency': <byte 0x02>"), HasSubstr("'resident': <true>")));
}

TEST_F(Notification, EscapesItsTextWhereTheServiceReadsMarkup) {
    ScriptedNotifications service(ScriptedNotifications::pressing("cancel"), {"actions", "body-markup"});
    ask();
    EXPECT_EQ(service.shown().at(0).body, "A driver (driver 1.0)\nLaser &lt;4&gt; &amp; more");
}

TEST_F(Notification, IsNotAskedWhereButtonsAreNotShown) {
    ScriptedNotifications service(ScriptedNotifications::pressing("install"), {"body", "body-markup"});
    EXPECT_EQ(ask(), PromptAnswer::NotAsked);
    EXPECT_THAT(service.shown(), IsEmpty());
}

TEST_F(Notification, ThatIsClosedIsNotAnswered) {
    for (const unsigned reason : {1U, 2U, 3U, 4U, 77U}) {
        ScriptedNotifications service(
            [reason](ScriptedNotifications& self, unsigned id) { self.close(id, reason); });
        NotificationPrompter prompter(events_);
        EXPECT_EQ(prompter.ask(kQuestion, Deadline::after(5s)), PromptAnswer::Unanswered) << reason;
    }
}

TEST_F(Notification, CountsByItsOwnButtonsOnly) {
    ScriptedNotifications service([](ScriptedNotifications& self, unsigned id) {
        self.press(id + 1, "install");
        self.press(id, "default");
        self.press(id, "");
        self.press(id, "INSTALL");
        self.close(id + 1, 2);
        self.press(id, "cancel");
        self.press(id, "install");
    });
    EXPECT_EQ(ask(), PromptAnswer::No);
}

TEST_F(Notification, IsNotAnsweredByOtherProcesses) {
    ScriptedNotifications service;
    BusThread forger([](GDBusConnection* connection) {
        for (unsigned i = 1; i < 10; ++i)
            later(i * 20, [connection] {
                g_dbus_connection_emit_signal(connection, nullptr, "/org/freedesktop/Notifications",
                                              "org.freedesktop.Notifications", "ActionInvoked",
                                              g_variant_new("(us)", 41U, "install"), nullptr);
            });
    });
    EXPECT_EQ(ask(300ms), PromptAnswer::Unanswered);
}

TEST_F(Notification, ThatNobodyAnswersIsTakenAwayInTime) {
    ScriptedNotifications service;
    const auto start = Clock::now();
    EXPECT_EQ(ask(100ms), PromptAnswer::Unanswered);
    EXPECT_LT(Clock::now() - start, 2s);
    EXPECT_EQ(service.takenAway().size(), 1U);
}

TEST_F(Notification, WhoseServiceDiesIsNotAsked) {
    ScriptedNotifications service([](ScriptedNotifications& self, unsigned) { self.goAway(); });
    const auto start = Clock::now();
    EXPECT_EQ(ask(), PromptAnswer::NotAsked);
    EXPECT_LT(Clock::now() - start, 2s);
}

TEST_F(Notification, WhoseBusDiesIsNotAsked) {
    ScriptedNotifications service([this](ScriptedNotifications&, unsigned) { bus_.stop(); });
    const auto start = Clock::now();
    EXPECT_EQ(ask(), PromptAnswer::NotAsked);
    EXPECT_LT(Clock::now() - start, 2s);
}

TEST_F(Notification, IsNotAskedWithoutAService) {
    EXPECT_EQ(ask(), PromptAnswer::NotAsked);
}

TEST(NotificationPrompter, IsNotAskedWithoutASession) {
    ASSERT_EQ(setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1), 0);
    EventContext events({});
    EXPECT_EQ(NotificationPrompter(events).ask(kQuestion, Deadline::after(5s)), PromptAnswer::NotAsked);
    unsetenv("DBUS_SESSION_BUS_ADDRESS");
}

TEST_F(Notification, EndsWithItsThread) {
    ScriptedNotifications service;
    const auto stopper = stopSoon(stop_);
    const auto start = Clock::now();
    EXPECT_EQ(ask(30s), PromptAnswer::Unanswered);
    EXPECT_LT(Clock::now() - start, 5s);
}

TEST_F(Notification, BecomesTheProgress) {
    ScriptedNotifications service(ScriptedNotifications::pressing("install"));
    ask();
    prompter_.showProgress("Installing", std::nullopt);
    prompter_.showProgress("Installing", 40);
    const auto shown = service.shown();
    ASSERT_EQ(shown.size(), 3U);
    for (const auto& notification : {shown[1], shown[2]}) {
        EXPECT_EQ(notification.id, shown[0].id);
        EXPECT_THAT(notification.buttons, IsEmpty());
        EXPECT_EQ(notification.title, "Installing");
    }
    EXPECT_EQ(shown[1].hints, "{}");
    EXPECT_EQ(shown[2].hints, "{'value': <40>}");
    EXPECT_EQ(shown[2].body, "40 %");
}

TEST_F(Notification, SaysHowItEndedOrIsTakenAway) {
    ScriptedNotifications service(ScriptedNotifications::pressing("install"));
    ask();
    prompter_.finish("It failed", "because");
    EXPECT_EQ(service.shown().back().title, "It failed");
    EXPECT_EQ(service.shown().back().body, "because");
    EXPECT_EQ(service.shown().back().timeLimit, -1);
    EXPECT_THAT(service.takenAway(), IsEmpty());
    prompter_.finish("", "");
    EXPECT_THAT(service.takenAway(), ElementsAre(service.shown().back().id));
}

TEST_F(Notification, IsSilentWhenItsServiceHasGone) {
    ScriptedNotifications service(ScriptedNotifications::pressing("install"));
    ask();
    service.goAway();
    prompter_.showProgress("Installing", 40);
    prompter_.finish("It failed", "because");
    EXPECT_LE(service.shown().size(), 1U);
}

}  // namespace
}  // namespace ventras
