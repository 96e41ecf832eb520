#include "platform/linux/scanners/ScannerEvents.h"

#include <glib.h>

#include <utility>

namespace ventras {
namespace {

// A source that sleeps until it is told that it is ready; dispatching puts it to sleep again.
gboolean dispatchOnce(GSource* source, GSourceFunc callback, gpointer data) {
    g_source_set_ready_time(source, -1);
    return callback(data);
}

GSourceFuncs kFunctions{nullptr, nullptr, dispatchOnce, nullptr, nullptr, nullptr};

}  // namespace

ScannerEvents::ScannerEvents(Handler onEvents)
    : onEvents_(std::move(onEvents)), source_(g_source_new(&kFunctions, sizeof(GSource))) {
    const auto onReady = [](gpointer self) -> gboolean {
        static_cast<ScannerEvents*>(self)->onEvents_();
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(source_, onReady, this, nullptr);
    g_source_attach(source_, nullptr);
}

ScannerEvents::~ScannerEvents() {
    g_source_destroy(source_);
    g_source_unref(source_);
}

void ScannerEvents::post(ScannerEvent event) {
    const std::lock_guard lock(mutex_);
    waiting_.push_back(std::move(event));
    g_source_set_ready_time(source_, 0);
}

std::vector<ScannerEvent> ScannerEvents::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(waiting_, {});
}

}  // namespace ventras
