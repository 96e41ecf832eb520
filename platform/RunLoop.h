#pragma once

#include <atomic>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>

#include "platform/Deadline.h"

struct _GMainContext;

namespace ventras {

/// The main thread's event loop, on GLib's default main context.
///
/// The thread that constructs it is the main thread. runUntil() belongs to that thread; stop() and
/// performOnMainThread() may be called from any.
class RunLoop {
public:
    RunLoop();

    /// Handles events until the deadline, or until stop() is called meanwhile.
    void runUntil(Deadline deadline);

    /// Ends the present runUntil() as soon as the event being handled is done.
    void stop();

    /// Runs a function on the main thread, between events, and waits until it has run; calls it directly when
    /// already there. The main thread must be in runUntil() or come back to it.
    void performOnMainThread(const std::function<void()>& function);

private:
    struct Task;
    void runWaitingTasks();

    _GMainContext* context_;
    std::thread::id mainThread_;
    std::atomic<bool> stopped_ = false;
    std::mutex mutex_;
    std::deque<std::shared_ptr<Task>> tasks_;
};

}  // namespace ventras
