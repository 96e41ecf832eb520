#pragma once

#include <functional>
#include <optional>
#include <stop_token>

#include "platform/Deadline.h"
#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// The events of one worker thread: signals from a bus, programs that end, people who type. Every wait for
/// them ends at its deadline, and at once when the thread is asked to stop.
///
/// It belongs to the thread that makes it, and is that thread's default main context while it lives.
class EventContext {
public:
    explicit EventContext(std::stop_token stop);
    EventContext(const EventContext&) = delete;
    EventContext& operator=(const EventContext&) = delete;
    ~EventContext();

    bool stopRequested() const { return stop_.stop_requested(); }

    /// Cancelled when the thread is asked to stop; for calls that take one.
    GCancellable* cancellable() const { return cancellable_.get(); }

    /// Handles events until the condition holds. @return whether it holds.
    bool waitUntil(const std::function<bool()>& condition, Deadline deadline);

    /// The same until a file descriptor has something to read, or is closed at the other end.
    bool waitUntilReadable(int descriptor, Deadline deadline);

private:
    GMainContext* context_;
    GObjectPtr<GCancellable> cancellable_;
    std::stop_token stop_;
    std::optional<std::stop_callback<std::function<void()>>> onStop_;
};

}  // namespace ventras
