#include "platform/linux/usb/TerminationHold.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>

namespace ventras {
namespace {

[[noreturn]] void ignoring(int signal) {
    std::signal(signal, SIG_IGN);
    {
        const TerminationHold hold;
        kill(getpid(), signal);
        if (TerminationHold::requested())
            _exit(2);
    }
    kill(getpid(), signal);
    _exit(0);
}

[[noreturn]] void holdingTwice(int signal) {
    {
        const TerminationHold outer;
        {
            const TerminationHold inner;
            kill(getpid(), signal);
            if (!TerminationHold::requested())
                _exit(2);
        }
        if (!TerminationHold::requested())
            _exit(3);
    }
    _exit(4);
}

volatile std::sig_atomic_t handled = 0;

[[noreturn]] void handling(int signal) {
    std::signal(signal, [](int number) { handled = number; });
    {
        const TerminationHold hold;
        kill(getpid(), signal);
        if (handled != 0)
            _exit(2);
    }
    _exit(handled == signal && !TerminationHold::requested() ? 0 : 3);
}

TEST(TerminationHold, LetsTheProcessEndWithTheLastHold) {
    for (const int signal : {SIGTERM, SIGINT, SIGHUP})
        EXPECT_EXIT(holdingTwice(signal), testing::KilledBySignal(signal), "");
}

TEST(TerminationHold, HandsTheSignalToTheUsualHandlerAfterwards) {
    EXPECT_EXIT(handling(SIGTERM), testing::ExitedWithCode(0), "");
}

TEST(TerminationHold, LeavesIgnoredSignalsIgnored) {
    EXPECT_EXIT(ignoring(SIGHUP), testing::ExitedWithCode(0), "");
}

TEST(TerminationHold, ChangesNothingWhenNobodyWantsTheProcessToEnd) {
    { const TerminationHold hold; }
    EXPECT_FALSE(TerminationHold::requested());
    struct sigaction now {};
    sigaction(SIGTERM, nullptr, &now);
    EXPECT_EQ(now.sa_handler, SIG_DFL);
}

}  // namespace
}  // namespace ventras
