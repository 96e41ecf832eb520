#pragma once

#include <functional>
#include <memory>

#include "platform/linux/scanners/ScannerEvents.h"

namespace ventras {

/// Which registrations of scanners are told.
enum class ScannerServices {
    OfTheNetwork,        ///< those of other devices
    AlsoOfThisComputer,  ///< also those on the loopback interface, as IPP-over-USB devices are registered
};

/// Watches for network scanners: services of the types "_uscan._tcp" and "_uscans._tcp" in DNS-SD (RFC 6763).
///
/// It runs a thread of its own, which is left to itself when the watch ends: a responder that hangs may hold
/// it for a while, and must not hold the program. Construct and destroy it on one thread.
class NetworkScannerWatch {
public:
    using Sink = std::function<void(ScannerEvent)>;

    /// @param sink called on the watch's own thread, never after destruction
    NetworkScannerWatch(ScannerServices services, Sink sink);
    ~NetworkScannerWatch();
    NetworkScannerWatch(const NetworkScannerWatch&) = delete;
    NetworkScannerWatch& operator=(const NetworkScannerWatch&) = delete;

private:
    class Outlet;

    std::shared_ptr<Outlet> outlet_;
};

}  // namespace ventras
