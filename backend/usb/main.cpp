// Stands in front of the scheduler's own backend for USB printers, which it becomes with the URI by which
// that backend knows the printer.

#include <chrono>
#include <cstdio>
#include <string>
#include <thread>

#include "backend/StockBackend.h"
#include "backend/usb/StockDeviceURI.h"
#include "backend/usb/StockListing.h"
#include "platform/linux/BoundedProgram.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

// Not in the folder of backends, where it would be asked for its devices too. The distribution's confinement
// of the scheduler lets what it started start nothing but what lies in a few folders, of which this is one.
constexpr const char* kStock = "daemon/stock-usb";

constexpr auto kListingLimit = 30s;
constexpr auto kRetryInterval = 5s;

/// Waits until the stock backend would find the printer. It would wait as well, but for the URI that it is
/// given, and which one that is may only be known when the printer is there.
std::string waitForPrinter(const std::string& uri) {
    for (;;) {
        const auto listing = outputOf({schedulerProgram(kStock)}, {}, kListingLimit);
        if (!listing)
            return uri;
        if (const auto listed = listedURI(uri, listedDevices(*listing)))
            return *listed;
        // A member of a class is not waited for, which the stock backend knows.
        if (schedulerVariable("CLASS"))
            return uri;
        std::fputs("INFO: Waiting for printer to become available.\n", stderr);
        std::this_thread::sleep_for(kRetryInterval);
    }
}

int print(char* arguments[]) {
    auto uri = stockDeviceURI(jobDeviceURI(arguments));
    if (uri.find("?serial=") != std::string::npos)
        uri = waitForPrinter(uri);
    return becomeStockBackend(kStock, uri, arguments);
}

}  // namespace
}  // namespace ventras

int main(int argc, char* argv[]) {
    const bool isJob = argc == 6 || argc == 7;
    return isJob ? ventras::print(argv) : ventras::becomeStockBackend(ventras::kStock, std::nullopt, argv);
}
