#include <cups/backend.h>
#include <strings.h>

#include <chrono>
#include <cstdio>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "backend/StockBackend.h"
#include "platform/Handles.h"
#include "platform/IppConnection.h"
#include "platform/linux/options/PrinterAddress.h"

namespace ventras {
namespace {

constexpr std::chrono::seconds kRetryInterval{5};

constexpr std::string_view kScheme = "ippusb://";

// The scheduler's message for people says why a job waits; nothing in it comes from the device or the queue.
constexpr const char* kAway =
    "INFO: The printer is unplugged or switched off, or its IPP-over-USB service is not running.\n";

void say(const char* line) {
    std::fputs(line, stderr);
}

// Queues for sending faxes say so in their PPD.
PrinterService serviceOfQueue() {
    const auto file = schedulerVariable("PPD");
    const PpdPtr ppd{file ? ppdOpenFile(file->c_str()) : nullptr};
    const auto* fax = ppd ? ppdFindAttr(ppd.get(), "cupsFax", nullptr) : nullptr;
    const bool isFax = fax != nullptr && fax->value != nullptr && strcasecmp(fax->value, "True") == 0;
    return isFax ? PrinterService::FaxOut : PrinterService::Print;
}

// A daemon that has just gone leaves its record behind for a moment, so only a port that answers counts.
std::optional<PrinterAddress> findPrinter(const std::string& deviceURI, PrinterService service) {
    auto address = PrinterAddress::find(deviceURI, service);
    if (address && !IppConnection::toPrinter(address->host, address->port, HTTP_ENCRYPTION_NEVER).connected())
        return std::nullopt;
    return address;
}

// Waits for as long as it takes, as a job for a printer that is switched off should; the scheduler ends the
// program when the job is cancelled. A member of a class gives the job back, for another member may be there.
std::optional<PrinterAddress> waitForPrinter(const std::string& deviceURI, PrinterService service) {
    auto address = findPrinter(deviceURI, service);
    if (address)
        return address;
    say("STATE: +offline-report\n");
    const bool isMemberOfClass = schedulerVariable("CLASS").has_value();
    do {
        say(kAway);  // each time anew: the filters have messages of their own, and the last one is shown
        std::this_thread::sleep_for(kRetryInterval);
        address = findPrinter(deviceURI, service);
    } while (!address && !isMemberOfClass);
    if (address)
        say("STATE: -offline-report\n");
    return address;
}

int print(char* arguments[]) {
    const auto deviceURI = jobDeviceURI(arguments);
    if (!deviceURI.starts_with(kScheme)) {
        say("ERROR: The queue's device URI is not one of a printer with IPP over USB.\n");
        return CUPS_BACKEND_STOP;
    }
    const auto address = waitForPrinter(deviceURI, serviceOfQueue());
    return address ? becomeStockBackend("backend/ipp", address->uri, arguments) : CUPS_BACKEND_FAILED;
}

}  // namespace
}  // namespace ventras

int main(int argc, char* argv[]) {
    if (argc == 1) {
        std::puts("direct ippusb \"Unknown\" \"Printer with IPP over USB\"");
        return CUPS_BACKEND_OK;
    }
    if (argc != 6 && argc != 7) {
        std::fputs("ERROR: Usage: ippusb JOB USER TITLE COPIES OPTIONS [FILE]\n", stderr);
        return CUPS_BACKEND_STOP;
    }
    return ventras::print(argv);
}
