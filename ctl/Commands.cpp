#include "ctl/CatalogueCommand.h"
#include "ctl/Command.h"
#include "ctl/DeviceCommand.h"
#include "ctl/DeviceIDCommand.h"
#include "ctl/ExplainCommand.h"
#include "ctl/PPDCommand.h"
#include "ctl/PackageCommand.h"
#include "ctl/PrinterCommand.h"
#include "ctl/QueueCommand.h"
#include "ctl/ScannersCommand.h"
#include "ctl/Translation.h"

namespace ventras {
namespace {

constexpr Command kCommands[] = {
    {"device-id", "STRING...|-", translatable("what an IEEE 1284 device ID says"), showDeviceIDs},
    {"txt", "[KEY=VALUE...|-]", translatable("what a TXT-style dictionary says"), showDescription},
    {"ppd", "FILE...", translatable("what a PPD file says"), showPPDs},
    {"kind", "", translatable("how driver records rank: reads a JSON array"), showKinds},
    {"match", "[-]", translatable("drivers that fit a device, best first"), showMatches, kMatchOptions},
    {"drivers", "", translatable("the scheduler's catalogue of drivers"), showDrivers},
    {"queues", "", translatable("the queues that the agent takes into account"), showQueues},
    {"name", "STRING|-", translatable("what a device's name becomes as a queue's name"), showNames,
     kNameOptions},
    {"usb", "", translatable("the USB printer interfaces that are attached"), showUsbPrinters},
    {"scanners", "", translatable("the scanners that are announced within 3 seconds"), showScanners},
    {"printer", "URI", translatable("what a network printer says of itself"), showPrinter},
    {"service", "NAME", translatable("what an IPP-over-USB printer says of itself in DNS-SD"), showService},
    {"scanner", "STRING", translatable("what a scanner's description says, and its PPD"), showScanner},
    {"predicate", "ID...", translatable("how driver packages for devices are asked for"), showPredicate},
    {"catalogue", "lookup ID|build DIR...",
     translatable("the driver packages for a device; the catalogue of them"), showPackages, kPackageOptions},
    {"explain",
     "ARGUMENT...",
     translatable("what the agent would do, if started so"),
     explainArguments,
     {},
     OptionOrder::AmongForeign},
};

}  // namespace

std::span<const Command> commands() {
    return kCommands;
}

}  // namespace ventras
