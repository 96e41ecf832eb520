#pragma once

#include <functional>
#include <latch>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/scanners/ScannerEvents.h"

namespace ventras {

/// Watches for USB scanners that the scanner driver collection knows, through udev and its hardware database;
/// no device is opened, or woken up. It runs a thread of its own; construct and destroy it on one thread.
class UsbScannerWatch {
public:
    using Sink = std::function<void(ScannerEvent)>;

    /// @param sink called on the watch's own thread
    explicit UsbScannerWatch(Sink sink);
    ~UsbScannerWatch();
    UsbScannerWatch(const UsbScannerWatch&) = delete;
    UsbScannerWatch& operator=(const UsbScannerWatch&) = delete;

    /// Waits until the devices that were there at the start have been told: a look into the kernel's memory,
    /// which takes milliseconds.
    void waitForFirstLook() { firstLook_.wait(); }

private:
    void watch();

    Sink sink_;
    FileDescriptor stop_;
    std::latch firstLook_{1};
    std::jthread thread_;
};

}  // namespace ventras
