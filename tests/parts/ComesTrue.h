#pragma once

#include <chrono>
#include <thread>

namespace ventras {

/// Waits until a condition holds. Any thread may call.
/// @param condition is asked every few milliseconds, and once more when the time is up
/// @return whether it came to hold.
template <class Condition>
bool comesTrue(Condition condition, std::chrono::milliseconds limit) {
    const auto giveUp = std::chrono::steady_clock::now() + limit;
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= giveUp)
            return condition();
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return true;
}

}  // namespace ventras
