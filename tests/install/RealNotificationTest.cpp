#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <stdexcept>
#include <thread>

#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/installer/NotificationPrompter.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const InstallQuestion kQuestion{"Install it?", "A driver (driver 1.0)\nLaser <4> & more", "Install",
                                "Not Now", "printer"};

/// A real X server without a screen, for programs that show windows.
class HiddenDisplay {
public:
    HiddenDisplay() {
        const auto giveUp = std::chrono::steady_clock::now() + 20s;
        while (!server_.standardOutput().ends_with('\n')) {
            if (!server_.isRunning() || std::chrono::steady_clock::now() > giveUp)
                throw std::runtime_error("no display: " + server_.standardError());
            std::this_thread::sleep_for(5ms);
        }
    }

    std::string name() const {
        const auto number = server_.standardOutput();
        return ":" + number.substr(0, number.find('\n'));
    }

private:
    RunningProgram server_{{"Xvfb", "-displayfd", "1", "-nolisten", "tcp", "-screen", "0", "640x480x24"}};
};

/// A real notification service (dunst), and a user who opens its menu and picks a line there.
class RealNotifications {
public:
    /// @param pick what the line in the menu begins with
    explicit RealNotifications(const std::string& pick) : pick_(writePick(pick)), dunst_(start()) {
        waitForService("org.freedesktop.Notifications", dunst_);
    }

    /// Opens the menu, or sweeps the notification away, once it is shown.
    void openMenu() const { waitAndCall("ContextMenuCall"); }
    void sweepAway() const { waitAndCall("NotificationCloseLast"); }

    /// The lines of the menu.
    std::string menu() const { return readFile(folder_ / "menu"); }

private:
    static constexpr const char* kPath = "/org/freedesktop/Notifications";

    std::filesystem::path writePick(const std::string& pick) const {
        const auto path = folder_.write(
            "pick", "#!/bin/sh\ntee \"" + (folder_ / "menu").string() + "\" | grep -m1 '^#" + pick + "'\n");
        std::filesystem::permissions(path, std::filesystem::perms{0755});
        return path;
    }

    RunningProgram start() const {
        const auto file = folder_.write("dunstrc", "[global]\ndmenu = " + pick_.string() + "\n");
        return RunningProgram({"dunst", "-conf", file}, {.environment = {{"DISPLAY", display_.name()}}});
    }

    static int shown() {
        constexpr DBusMethod kGet{Bus::Session, "org.freedesktop.Notifications", kPath,
                                  "org.freedesktop.DBus.Properties", "Get"};
        const auto answer =
            callDBus(kGet, g_variant_new("(ss)", "org.dunstproject.cmd0", "displayedLength"), "(v)", 5s);
        if (!answer.reply)
            return 0;
        const VariantPtr box{g_variant_get_child_value(answer.reply.get(), 0)};
        const VariantPtr number{g_variant_get_variant(box.get())};
        return static_cast<int>(g_variant_get_uint32(number.get()));
    }

    static void waitAndCall(const char* method) {
        comesTrue([] { return shown() != 0; }, 5s);
        const DBusMethod call{Bus::Session, "org.freedesktop.Notifications", kPath, "org.dunstproject.cmd0",
                              method};
        callDBus(call, g_variant_new("()"), "()", 5s);
    }

    TemporaryFolder folder_;
    HiddenDisplay display_;
    std::filesystem::path pick_;
    RunningProgram dunst_;
};

class RealNotification : public testing::Test {
protected:
    template <class User>
    PromptAnswer ask(User user) {
        const std::jthread thread(user);
        return prompter_.ask(kQuestion, Deadline::after(10s));
    }

    PrivateBus bus_;
    EventContext events_{std::stop_token()};
    NotificationPrompter prompter_{events_};
};

TEST_F(RealNotification, IsAnsweredByItsButtons) {
    const RealNotifications desktop("Install");
    EXPECT_EQ(ask([&] { desktop.openMenu(); }), PromptAnswer::Yes);
    EXPECT_THAT(desktop.menu(), testing::HasSubstr("#Not Now"));
    prompter_.showProgress("Installing", 40);
    prompter_.finish("Done", "");
}

TEST_F(RealNotification, MayBeDeclined) {
    const RealNotifications desktop("Not Now");
    EXPECT_EQ(ask([&] { desktop.openMenu(); }), PromptAnswer::No);
}

TEST_F(RealNotification, ThatIsSweptAwayIsNotAnswered) {
    const RealNotifications desktop("Install");
    EXPECT_EQ(ask([&] { desktop.sweepAway(); }), PromptAnswer::Unanswered);
}

}  // namespace
}  // namespace ventras
