#pragma once

#include <functional>
#include <mutex>
#include <string>
#include <vector>

#include "platform/ImageDeviceBrowser.h"

struct _GSource;

namespace ventras {

/// A scanner that came, or went, as one of the watches saw it.
struct ScannerEvent {
    enum class Kind { Added, Removed };

    Kind kind;
    std::string key;     ///< what the watch knows it by; unique among all watches
    ImageDevice device;  ///< empty for a removal
};

/// Carries events from the watches' threads to the main thread, in order.
///
/// Any thread may post; construct, destroy and take on the main thread. Nothing is delivered after
/// destruction.
class ScannerEvents {
public:
    using Handler = std::function<void()>;

    /// @param onEvents called on the main thread, by its event loop, when there are events to take
    explicit ScannerEvents(Handler onEvents);
    ~ScannerEvents();
    ScannerEvents(const ScannerEvents&) = delete;
    ScannerEvents& operator=(const ScannerEvents&) = delete;

    void post(ScannerEvent event);

    /// The events posted since the last call, oldest first.
    std::vector<ScannerEvent> take();

private:
    Handler onEvents_;
    _GSource* source_;
    std::mutex mutex_;
    std::vector<ScannerEvent> waiting_;
};

}  // namespace ventras
