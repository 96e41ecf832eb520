#include "agent/Request.h"

#include <cstdio>
#include <set>
#include <utility>

#include "agent/CommandLine.h"
#include "devices/IPPUSBObject.h"
#include "devices/ScannerObject.h"
#include "devices/UsbEnumeration.h"
#include "devices/VellumProfilePrinterObject.h"
#include "platform/Platform.h"
#include "platform/Utf8.h"

namespace ventras {
namespace {

// Gathers the request one argument at a time.
class Reader {
public:
    Reader(Platform& platform, PPDManager& drivers)
        : platform_(platform), drivers_(drivers), usb_(platform, drivers, platform.usb) {}

    void take(const std::string& argument) {
        if (!isValidUtf8(argument)) {
            std::fprintf(stderr, "An argument that is no UTF-8 text was ignored\n");
            return;
        }
        const auto [kind, text] = parseArgument(argument);
        switch (kind) {
            case ArgumentKind::Deprecated:
                std::fprintf(stderr, "Deprecated or unsupports options...\n");
                break;
            case ArgumentKind::UsbLocation:
                usbLocations_.emplace_back(text);
                break;
            case ArgumentKind::Scanner:
                takeScanner(text);
                break;
            case ArgumentKind::IppUsb:
                request_.devices.push_back(
                    IPPUSBObject::ippUSBObjectWithRegisteredName(drivers_, std::string(text)));
                request_.namesIppUsbPrinter = true;
                break;
            case ArgumentKind::NoDownload:
                request_.downloadsDrivers = false;
                break;
            case ArgumentKind::Skerrow:
                request_.skerrow = true;
                break;
            case ArgumentKind::NetworkURI:
                takeNetworkURI(argument);
                break;
            case ArgumentKind::Ignored:
                break;
        }
    }

    Request finish() {
        if (!usbLocations_.empty())
            for (auto& printer : usb_.printerObjects(usbLocations_))
                request_.devices.push_back(std::move(printer));
        return std::move(request_);
    }

private:
    void takeScanner(std::string_view description) {
        if (auto scanner =
                ScannerObject::scannerObjectWithString(description, usb_, platform_.computerName)) {
            request_.devices.push_back(std::move(scanner));
            request_.downloadsDrivers = false;
        }
    }

    void takeNetworkURI(const std::string& uri) {
        if (networkURIs_.insert(uri).second)
            request_.devices.push_back(
                VellumProfilePrinterObject::initVellumProfilePrinterObjectWithURI(platform_, drivers_, uri));
    }

    Platform& platform_;
    PPDManager& drivers_;
    UsbEnumeration usb_;
    UsbEnumeration::LocationFilter usbLocations_;
    std::set<std::string, std::less<>> networkURIs_;
    Request request_;
};

}  // namespace

Request requestFromArguments(std::span<const std::string> arguments, Platform& platform,
                             PPDManager& drivers) {
    Reader reader(platform, drivers);
    for (const auto& argument : arguments)
        reader.take(argument);
    return reader.finish();
}

}  // namespace ventras
