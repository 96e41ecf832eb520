#pragma once

#include <chrono>
#include <stop_token>
#include <thread>

namespace ventras {

/// Asks for a stop a moment later, when who is to follow it is already waiting for something else.
/// @return the thread that asks; it ends with its owner.
inline std::jthread stopSoon(std::stop_source stop) {
    return std::jthread([stop]() mutable {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        stop.request_stop();
    });
}

}  // namespace ventras
