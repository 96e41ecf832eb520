#include "platform/RunLoop.h"

#include <glib.h>

#include <memory>
#include <semaphore>

namespace ventras {

// Shared, because the waiting thread goes on while release() may not yet have returned on the main thread.
struct RunLoop::Task {
    explicit Task(const std::function<void()>& work) : function(work) {}

    const std::function<void()>& function;
    std::binary_semaphore done{0};
};

RunLoop::RunLoop() : context_(g_main_context_default()), mainThread_(std::this_thread::get_id()) {}

void RunLoop::runUntil(Deadline deadline) {
    stopped_ = false;
    bool timeIsUp = false;
    const auto onTimeout = [](gpointer flag) -> gboolean {
        *static_cast<bool*>(flag) = true;
        return G_SOURCE_REMOVE;
    };
    const auto milliseconds = static_cast<guint>(deadline.remaining().count());
    const std::unique_ptr<GSource, decltype(&g_source_unref)> timer{g_timeout_source_new(milliseconds),
                                                                    &g_source_unref};
    g_source_set_callback(timer.get(), onTimeout, &timeIsUp, nullptr);
    g_source_attach(timer.get(), context_);

    for (;;) {
        runWaitingTasks();
        if (stopped_ || timeIsUp)
            break;
        g_main_context_iteration(context_, TRUE);
    }
    g_source_destroy(timer.get());
}

void RunLoop::stop() {
    stopped_ = true;
    g_main_context_wakeup(context_);
}

void RunLoop::performOnMainThread(const std::function<void()>& function) {
    if (std::this_thread::get_id() == mainThread_) {
        function();
        return;
    }
    const auto task = std::make_shared<Task>(function);
    {
        const std::lock_guard lock(mutex_);
        tasks_.push_back(task);
    }
    g_main_context_wakeup(context_);
    task->done.acquire();
}

void RunLoop::runWaitingTasks() {
    for (;;) {
        std::shared_ptr<Task> task;
        {
            const std::lock_guard lock(mutex_);
            if (tasks_.empty())
                return;
            task = std::move(tasks_.front());
            tasks_.pop_front();
        }
        task->function();
        task->done.release();
    }
}

}  // namespace ventras
