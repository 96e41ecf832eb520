#include "platform/linux/scanners/NetworkScannerWatch.h"

#include <avahi-common/simple-watch.h>
#include <poll.h>
#include <sys/eventfd.h>

#include <chrono>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>

#include "platform/Deadline.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/scanners/ScannerServiceBrowser.h"

namespace ventras {
namespace {

// The responder may be started, or restarted, at any time.
constexpr std::chrono::seconds kReconnect{1};

using PollPtr = std::unique_ptr<AvahiSimplePoll, decltype(&avahi_simple_poll_free)>;

}  // namespace

// What the watch and its thread share: the way out for events, which the watch shuts, and the call to stop.
class NetworkScannerWatch::Outlet {
public:
    explicit Outlet(Sink sink) : sink_(std::move(sink)), stop_(eventfd(0, EFD_CLOEXEC)) {}

    void pass(ScannerEvent event) {
        const std::lock_guard lock(mutex_);
        if (sink_)
            sink_(std::move(event));
    }

    void shut() {
        {
            const std::lock_guard lock(mutex_);
            sink_ = nullptr;
        }
        eventfd_write(stop_.get(), 1);
    }

    int stopDescriptor() const { return stop_.get(); }

    bool isShutWithin(std::chrono::milliseconds time) const {
        pollfd stop{stop_.get(), POLLIN, 0};
        return poll(&stop, 1, static_cast<int>(time.count())) > 0;
    }

private:
    std::mutex mutex_;
    Sink sink_;
    FileDescriptor stop_;
};

namespace {

template <class OutletPtr>
void browseOnce(ScannerServices services, const OutletPtr& outlet) {
    const PollPtr loop{avahi_simple_poll_new(), &avahi_simple_poll_free};
    if (!loop)
        return;
    const auto* poll = avahi_simple_poll_get(loop.get());
    const auto onStop = [](AvahiWatch*, int, AvahiWatchEvent, void* self) {
        avahi_simple_poll_quit(static_cast<AvahiSimplePoll*>(self));
    };
    AvahiWatch* stop = poll->watch_new(poll, outlet->stopDescriptor(), AVAHI_WATCH_IN, onStop, loop.get());
    {
        ScannerServiceBrowser browser(loop.get(), services,
                                      [&outlet](ScannerEvent event) { outlet->pass(std::move(event)); });
        while (!browser.hasFailed() && avahi_simple_poll_iterate(loop.get(), -1) == 0) {
        }
    }
    poll->watch_free(stop);
}

}  // namespace

NetworkScannerWatch::NetworkScannerWatch(ScannerServices services, Sink sink)
    : outlet_(std::make_shared<Outlet>(std::move(sink))) {
    std::thread([services, outlet = outlet_] {
        do {
            browseOnce(services, outlet);
        } while (!outlet->isShutWithin(kReconnect));
    }).detach();
}

NetworkScannerWatch::~NetworkScannerWatch() {
    outlet_->shut();
}

}  // namespace ventras
