#include "platform/linux/usb/TerminationHold.h"

#include <unistd.h>

#include <array>
#include <atomic>
#include <csignal>
#include <cstddef>
#include <mutex>

namespace ventras {
namespace {

constexpr std::array kSignals{SIGHUP, SIGINT, SIGTERM};

std::mutex mutex;
int holds = 0;
std::array<struct sigaction, kSignals.size()> usual{};
// The only thing that the handler touches; the last request counts.
std::atomic<int> wanted = 0;
static_assert(std::atomic<int>::is_always_lock_free);

void remember(int signal) {
    wanted.store(signal, std::memory_order_relaxed);
}

void holdSignals() {
    struct sigaction hold {};
    hold.sa_handler = remember;
    hold.sa_flags = SA_RESTART;
    for (std::size_t i = 0; i < kSignals.size(); ++i) {
        sigaction(kSignals.at(i), nullptr, &usual.at(i));
        // What was to be ignored stays ignored, e.g. SIGHUP of a program that outlives its terminal.
        if ((usual.at(i).sa_flags & SA_SIGINFO) != 0 || usual.at(i).sa_handler != SIG_IGN)
            sigaction(kSignals.at(i), &hold, nullptr);
    }
}

}  // namespace

TerminationHold::TerminationHold() {
    const std::lock_guard lock(mutex);
    if (holds++ == 0)
        holdSignals();
}

TerminationHold::~TerminationHold() {
    const std::lock_guard lock(mutex);
    if (--holds > 0)
        return;
    for (std::size_t i = 0; i < kSignals.size(); ++i)
        sigaction(kSignals.at(i), &usual.at(i), nullptr);
    if (const int signal = wanted.exchange(0); signal != 0)
        kill(getpid(), signal);
}

bool TerminationHold::requested() {
    return wanted.load(std::memory_order_relaxed) != 0;
}

}  // namespace ventras
