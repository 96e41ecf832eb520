#include "ctl/ScannersCommand.h"

#include <array>
#include <chrono>

#include "ctl/Complaint.h"
#include "ctl/Evidence.h"
#include "ctl/Output.h"
#include "ctl/Services.h"
#include "ctl/Translation.h"
#include "devices/TXTRecord.h"
#include "platform/Deadline.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/RunLoop.h"

namespace ventras {
namespace {

// Responders on a busy network take a second or two to answer.
constexpr std::chrono::seconds kListeningTime{3};

// All that the agent ever looks for: scanners at this computer and those of IPP-over-USB printers.
constexpr auto kDeviceTypes =
    ImageDeviceTypes::kScanners | ImageDeviceTypes::kReachable | ImageDeviceTypes::kRegisteredHere;

constexpr std::array kColumns{
    Column{"transport", translatable("TRANSPORT")}, Column{"uuidString", translatable("UUID")},
    Column{"serialNumber", translatable("SERIAL NUMBER")}, Column{"modulePath", translatable("MODULE")}};

Object rowOf(const ImageDevice& device) {
    return {{"transport", device.transport},
            {"usbLocation", device.usbLocation},
            {"usbVendor", device.usbVendor},
            {"usbProduct", device.usbProduct},
            {"serialNumber", device.serialNumber},
            {"txtRecord", objectOf(dictionaryFromTXTRecord(device.txtRecord))},
            {"uuidString", device.uuidString},
            {"modulePath", device.modulePath}};
}

}  // namespace

Exit showScanners(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty())
        return usageError(translated("scanners: takes no operand"));
    Services services;
    const auto browser = services.platform().makeImageDeviceBrowser();
    browser->setBrowsedDeviceTypeMask(kDeviceTypes);
    browser->start();
    services.platform().runLoop.runUntil(Deadline::after(kListeningTime));
    Array rows;
    for (const auto& device : browser->devices())
        rows.emplace_back(rowOf(device));
    output.print(rows, kColumns);
    return Exit::Success;
}

}  // namespace ventras
