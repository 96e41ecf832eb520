#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>

#include "platform/linux/installer/DialogPrompter.h"
#include "tests/install/StopSoon.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::HasSubstr;
using testing::Not;
using Clock = std::chrono::steady_clock;

const InstallQuestion kQuestion{"Install it?", "A driver\nfor <b>Laser</b>; $(touch x) `y` & \"z\"",
                                "Install", "Not Now", "printer"};

// A desktop with a display and, as programs for windows, scripts that note how they were called.
class Dialog : public testing::Test {
protected:
    Dialog() {
        signal(SIGPIPE, SIG_IGN);
        folder_.write("wayland-0", "");
        setenv("XDG_RUNTIME_DIR", folder_.path().c_str(), 1);
        setenv("WAYLAND_DISPLAY", "wayland-0", 1);
        unsetenv("DISPLAY");
        setenv("PATH", ((folder_ / "bin").string() + ":/usr/bin:/bin").c_str(), 1);
    }
    ~Dialog() override {
        setenv("PATH", path_.c_str(), 1);
        unsetenv("WAYLAND_DISPLAY");
        unsetenv("XDG_RUNTIME_DIR");
    }

    /// Each call is noted as a line of its own, arguments with "|" between.
    void install(const std::string& program, const std::string& commands) const {
        const auto script = "#!/bin/sh\n{ printf '" + program +
                            "'; printf '|%s' \"$@\"; echo '|end'; } >> \"" + (folder_ / "calls").string() +
                            "\"\n" + commands + "\n";
        std::filesystem::permissions(folder_.write("bin/" + program, script), std::filesystem::perms{0755});
    }

    std::string calls() const { return readFile(folder_ / "calls"); }

    PromptAnswer ask(std::chrono::milliseconds limit = 10s) {
        return prompter_.ask(kQuestion, Deadline::after(limit));
    }

    std::string path_ = getenv("PATH");
    TemporaryFolder folder_;
    std::stop_source stop_;
    EventContext events_{stop_.get_token()};
    DialogPrompter prompter_{events_};
};

struct ExitCase {
    const char* commands;
    PromptAnswer answer;
};
constexpr ExitCase kZenityExits[] = {
    {"exit 0", PromptAnswer::Yes},        {"exit 1", PromptAnswer::No},
    {"exit 5", PromptAnswer::Unanswered}, {"exit 255", PromptAnswer::NotAsked},
    {"exit 127", PromptAnswer::NotAsked}, {"kill -9 $$", PromptAnswer::NotAsked},
};

TEST_F(Dialog, IsAnsweredByTheProgramsStatus) {
    for (const auto& [commands, answer] : kZenityExits) {
        install("zenity", commands);
        install("kdialog", "exit 254");
        EXPECT_EQ(ask(), answer) << commands;
    }
}

TEST_F(Dialog, HandsTheTextsOverAsTheyStand) {
    install("zenity", "exit 0");
    ask();
    EXPECT_THAT(calls(), HasSubstr("|--no-markup|"));
    EXPECT_THAT(calls(), HasSubstr("|--default-cancel|"));
    EXPECT_THAT(calls(),
                HasSubstr("|--text=Install it?\n\nA driver\nfor <b>Laser</b>; $(touch x) `y` & \"z\"|"));
    EXPECT_THAT(calls(), HasSubstr("|--ok-label=Install|--cancel-label=Not Now|"));
}

TEST_F(Dialog, IsTheOtherProgramsWhereTheFirstDoesNotWork) {
    install("zenity", "exit 255");
    install("kdialog", "exit 0");
    EXPECT_EQ(ask(), PromptAnswer::Yes);
    EXPECT_THAT(calls(), HasSubstr("kdialog|"));
    EXPECT_THAT(calls(),
                HasSubstr("<qt>Install it?<br><br>A driver<br>for &lt;b&gt;Laser&lt;/b&gt;; $(touch x)"));
}

TEST_F(Dialog, ThatStaysOpenIsTakenAwayInTime) {
    install("zenity", "echo $$ > \"" + (folder_ / "pid").string() + "\"; exec sleep 60");
    const auto start = Clock::now();
    EXPECT_EQ(ask(300ms), PromptAnswer::Unanswered);
    EXPECT_LT(Clock::now() - start, 5s);
    EXPECT_EQ(kill(std::stoi(readFile(folder_ / "pid")), 0), -1);
}

TEST_F(Dialog, EndsWithItsThread) {
    install("zenity", "exec sleep 60");
    const auto stopper = stopSoon(stop_);
    const auto start = Clock::now();
    EXPECT_EQ(ask(30s), PromptAnswer::Unanswered);
    EXPECT_LT(Clock::now() - start, 5s);
}

TEST_F(Dialog, ShowsProgressAndEnds) {
    install("zenity", "[ \"$1\" != --progress ] || exec cat > \"" + (folder_ / "progress").string() + "\"");
    ask();
    prompter_.showProgress("Installing", std::nullopt);
    prompter_.showProgress("Installing", 40);
    prompter_.showProgress("Installing", 100);
    comesTrue([&] { return readFile(folder_ / "progress").ends_with("99\n"); }, 5s);
    EXPECT_EQ(readFile(folder_ / "progress"), "# Installing\n# Installing\n40\n# Installing\n99\n");
    prompter_.finish("It failed", "because");
    comesTrue([&] { return calls().find("--info") != std::string::npos; }, 5s);
    EXPECT_THAT(calls(),
                HasSubstr("zenity|--info|--no-markup|--timeout=60|--title=It failed|--text=because|"));
}

TEST_F(Dialog, DoesNotMindAProgressWindowThatIsClosed) {
    install("zenity", "exit 0");
    ask();
    for (std::uint32_t i = 0; i < 100; ++i)
        prompter_.showProgress("Installing", i);
    prompter_.finish("", "");
    EXPECT_THAT(calls(), Not(HasSubstr("--info")));
}

TEST_F(Dialog, IsNotAskedWithoutItsPrograms) {
    setenv("PATH", (folder_ / "bin").c_str(), 1);
    EXPECT_EQ(ask(), PromptAnswer::NotAsked);
}

struct DisplayCase {
    const char *wayland, *x11;
    bool isThere;
};
constexpr DisplayCase kDisplays[] = {
    {"wayland-0", "", true},       {"wayland-7", "", false},       {"", "", false},
    {"", ":98765", false},         {"", ":98765.0", false},        {"", "localhost:10.0", true},
    {"wayland-0", ":98765", true}, {"wayland-7", ":98765", false},
};

TEST_F(Dialog, NeedsADisplay) {
    install("zenity", "exit 0");
    for (const auto& [wayland, x11, isThere] : kDisplays) {
        setenv("WAYLAND_DISPLAY", wayland, 1);
        setenv("DISPLAY", x11, 1);
        EXPECT_EQ(ask(), isThere ? PromptAnswer::Yes : PromptAnswer::NotAsked) << wayland << ' ' << x11;
    }
    unsetenv("DISPLAY");
}

}  // namespace
}  // namespace ventras
