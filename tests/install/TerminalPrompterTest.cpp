#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <future>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/installer/TerminalPrompter.h"
#include "tests/install/StopSoon.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::AllOf;
using testing::HasSubstr;
using Clock = std::chrono::steady_clock;

const InstallQuestion kQuestion{"Install it?", "A driver", "Install", "Not Now", "printer"};

// A terminal with somebody at it.
class Terminal : public testing::Test {
protected:
    Terminal() {
        int keyboard = -1, terminal = -1;
        if (openpty(&keyboard, &terminal, nullptr, nullptr, nullptr) != 0)
            throw std::runtime_error("no terminal");
        person_ = FileDescriptor(keyboard);
        terminal_ = FileDescriptor(terminal);
    }

    PromptAnswer ask(std::chrono::milliseconds limit = 5s) {
        return TerminalPrompter(events_, terminal_.get(), terminal_.get())
            .ask(kQuestion, Deadline::after(limit));
    }

    /// Types once the question is on the screen.
    PromptAnswer answer(const std::string& text) {
        const std::jthread typist([this, text] {
            screen_ = readUntil("[y/N] ");
            type(text);
        });
        return ask();
    }

    void type(const std::string& text) const {
        ASSERT_EQ(write(person_.get(), text.data(), text.size()), static_cast<ssize_t>(text.size()));
    }

    std::string readUntil(const std::string& end) const {
        std::string text;
        std::array<char, 256> buffer{};
        while (text.find(end) == std::string::npos) {
            const auto length = read(person_.get(), buffer.data(), buffer.size());
            if (length <= 0)
                break;
            text.append(buffer.data(), static_cast<std::size_t>(length));
        }
        return text;
    }

    std::stop_source stop_;
    EventContext events_{stop_.get_token()};
    FileDescriptor person_;
    FileDescriptor terminal_;
    std::string screen_;
};

struct LineCase {
    const char* line;
    PromptAnswer answer;
};
constexpr LineCase kLines[] = {
    {"y\n", PromptAnswer::Yes},         {"Y\n", PromptAnswer::Yes},        {"yes\n", PromptAnswer::Yes},
    {" YES \n", PromptAnswer::Yes},     {"\n", PromptAnswer::No},          {"n\n", PromptAnswer::No},
    {"no\n", PromptAnswer::No},         {"yesterday\n", PromptAnswer::No}, {"install\n", PromptAnswer::No},
    {"\x04", PromptAnswer::Unanswered},  // end of input
};

TEST_F(Terminal, TakesOnlyAYesForAYes) {
    for (const auto& [line, expected] : kLines)
        EXPECT_EQ(answer(line), expected) << line;
    EXPECT_THAT(screen_, AllOf(HasSubstr("Install it?"), HasSubstr("A driver"), HasSubstr("Install? [y/N]")));
}

TEST_F(Terminal, TakesNothingForAnAnswerThatWasTypedBefore) {
    type("y\n");
    std::this_thread::sleep_for(20ms);
    EXPECT_EQ(answer("n\n"), PromptAnswer::No);
}

TEST_F(Terminal, DoesNotWaitForEver) {
    const auto start = Clock::now();
    EXPECT_EQ(ask(100ms), PromptAnswer::Unanswered);
    EXPECT_LT(Clock::now() - start, 2s);
}

TEST_F(Terminal, DoesNotTakeHalfALine) {
    const std::jthread typist([this] {
        readUntil("[y/N] ");
        type("y");
    });
    EXPECT_EQ(ask(200ms), PromptAnswer::Unanswered);
}

TEST_F(Terminal, EndsWithItsThread) {
    const auto stopper = stopSoon(stop_);
    EXPECT_EQ(ask(30s), PromptAnswer::Unanswered);
}

TEST_F(Terminal, IsUnansweredWhenItIsClosed) {
    const std::jthread hangUp([this] {
        readUntil("[y/N] ");
        person_ = FileDescriptor();
    });
    EXPECT_EQ(ask(), PromptAnswer::Unanswered);
}

TEST_F(Terminal, ShowsProgressInOneLine) {
    TerminalPrompter prompter(events_, terminal_.get(), terminal_.get());
    prompter.showProgress("Installing", std::nullopt);
    prompter.showProgress("Installing", 40);
    prompter.finish("It failed", "because");
    EXPECT_EQ(readUntil("because\r\n"),
              "\r\x1B[KInstalling\r\x1B[KInstalling 40 %\r\nIt failed\r\nbecause\r\n");
}

TEST(TerminalPrompter, AsksNobodyWhereThereIsNoTerminal) {
    EventContext events({});
    std::array<int, 2> ends{};
    ASSERT_EQ(pipe(ends.data()), 0);
    const FileDescriptor reading(ends[0]);
    const FileDescriptor writing(ends[1]);
    EXPECT_EQ(TerminalPrompter(events, reading.get(), writing.get()).ask(kQuestion, Deadline::after(1s)),
              PromptAnswer::NotAsked);
}

}  // namespace
}  // namespace ventras
