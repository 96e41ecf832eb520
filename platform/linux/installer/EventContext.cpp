#include "platform/linux/installer/EventContext.h"

#include <glib-unix.h>

#include <memory>
#include <utility>

namespace ventras {
namespace {

/// A source of events in a main context, for as long as it lives; sets a flag when its event comes.
class Source {
public:
    Source(GSource* source, GMainContext* context) : source_(source) { g_source_attach(source_, context); }
    Source(const Source&) = delete;
    Source& operator=(const Source&) = delete;
    ~Source() {
        g_source_destroy(source_);
        g_source_unref(source_);
    }

private:
    GSource* source_;
};

gboolean setFlag(gpointer flag) {
    *static_cast<bool*>(flag) = true;
    return G_SOURCE_REMOVE;
}

gboolean setFlagWhenReadable(gint, GIOCondition, gpointer flag) {
    return setFlag(flag);
}

// What is left is rounded down; at its end the deadline is to have passed.
GSource* timer(Deadline deadline, bool& isOver) {
    GSource* source = g_timeout_source_new(static_cast<guint>(deadline.remaining().count()) + 1);
    g_source_set_callback(source, setFlag, &isOver, nullptr);
    return source;
}

GSource* reader(int descriptor, bool& isReadable) {
    GSource* source =
        g_unix_fd_source_new(descriptor, static_cast<GIOCondition>(G_IO_IN | G_IO_HUP | G_IO_ERR));
    g_source_set_callback(source, G_SOURCE_FUNC(setFlagWhenReadable), &isReadable, nullptr);
    return source;
}

}  // namespace

EventContext::EventContext(std::stop_token stop)
    : context_(g_main_context_new()), cancellable_(g_cancellable_new()), stop_(std::move(stop)) {
    g_main_context_push_thread_default(context_);
    onStop_.emplace(stop_, [this] {
        g_cancellable_cancel(cancellable_.get());
        g_main_context_wakeup(context_);
    });
}

EventContext::~EventContext() {
    onStop_.reset();
    g_main_context_pop_thread_default(context_);
    g_main_context_unref(context_);
}

bool EventContext::waitUntil(const std::function<bool()>& condition, Deadline deadline) {
    bool timeIsUp = false;
    const Source timeLimit(timer(deadline, timeIsUp), context_);
    while (!condition() && !timeIsUp && !stop_.stop_requested())
        g_main_context_iteration(context_, TRUE);
    return condition();
}

bool EventContext::waitUntilReadable(int descriptor, Deadline deadline) {
    bool isReadable = false;
    const Source source(reader(descriptor, isReadable), context_);
    return waitUntil([&] { return isReadable; }, deadline);
}

}  // namespace ventras
