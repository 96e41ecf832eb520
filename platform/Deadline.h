#pragma once

#include <chrono>

namespace ventras {

/// A moment by which something must have ended. A plain value, free to copy between threads.
class Deadline {
public:
    using Clock = std::chrono::steady_clock;

    static Deadline after(std::chrono::milliseconds time) { return Deadline{Clock::now() + time}; }

    Clock::time_point moment() const { return moment_; }
    bool passed() const { return Clock::now() >= moment_; }

    /// Time left, never negative.
    std::chrono::milliseconds remaining() const;

private:
    explicit Deadline(Clock::time_point moment) : moment_(moment) {}

    Clock::time_point moment_;
};

}  // namespace ventras
