#pragma once

#include <functional>
#include <thread>

#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// A connection of its own to the system bus of the environment, served by a thread of its own: the other
/// side in tests of what talks over the bus.
class BusThread {
public:
    /// Returns when `setUp` has run, on the new thread.
    explicit BusThread(std::function<void(GDBusConnection*)> setUp);
    BusThread(const BusThread&) = delete;
    BusThread& operator=(const BusThread&) = delete;
    ~BusThread();

private:
    GMainContext* context_;
    GMainLoop* loop_;
    std::thread thread_;
};

/// Calls a method of the bus itself and waits for its answer.
void callBus(GDBusConnection* connection, const char* method, GVariant* arguments);

}  // namespace ventras
