#include "ctl/DeviceCommand.h"

#include <array>

#include "ctl/Complaint.h"
#include "ctl/Output.h"
#include "ctl/Services.h"
#include "ctl/Translation.h"
#include "devices/ScannerObject.h"
#include "devices/UsbEnumeration.h"
#include "devices/UsbInterfaceReader.h"
#include "download/DownloadTriggerOperation.h"
#include "platform/FileContent.h"
#include "platform/TemporaryFile.h"

namespace ventras {
namespace {

constexpr std::array kUsbColumns{
    Column{"location", translatable("LOCATION")}, Column{"interfaceNumber", translatable("INTERFACE")},
    Column{"vendorID", translatable("VENDOR")}, Column{"productID", translatable("PRODUCT")},
    Column{"deviceID", translatable("DEVICE ID")}};

Object usbPrinter(UsbInterfaceReader& reader, const UsbInterfaceService& service) {
    const auto identity = reader.readIdentity(service);
    const auto deviceID = reader.readDeviceID(service);
    return {{"location", identity.location},
            {"interfaceNumber", identity.interfaceNumber},
            {"vendorID", identity.vendorID},
            {"productID", identity.productID},
            {"deviceID", deviceID},
            {"listIPPOverUSBInterfaces", reader.listIPPOverUSBInterfaces(service, deviceID)}};
}

/// The text of the PPD, which is a file only for as long as it is being read.
std::optional<std::string> ppdText(const ScannerObject& scanner) {
    auto path = scanner.ppdFile();
    if (!path)
        return std::nullopt;
    const auto file = TemporaryFile::adopt(*std::move(path));
    return fileContent(file.path());
}

Object scannerAnswers(ScannerObject& scanner) {
    return {{"uuidString", scanner.uuidString()},
            {"persistentID", scanner.persistentID()},
            {"transportType", scanner.transportType()},
            {"name", scanner.name()},
            {"iconPath", scanner.iconPath()},
            {"modulePath", scanner.modulePath()},
            {"type", static_cast<std::int64_t>(scanner.type())},
            {"usbLocationID", scanner.usbLocationID()},
            {"usbProductID", scanner.usbProductID()},
            {"usbVendorID", scanner.usbVendorID()},
            {"fwGUID", scanner.fwGUID()},
            {"corvidServiceName", scanner.corvidServiceName()},
            {"isMFP", scanner.isMFP()},
            {"deviceURI", scanner.deviceURI()},
            {"deviceLocation", scanner.deviceLocation()},
            {"ppdFile", ppdText(scanner)}};
}

}  // namespace

Exit showUsbPrinters(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty())
        return usageError(translated("usb: takes no operand"));
    Services services;
    auto& registry = services.platform().usb;
    const auto interfaces = registry.matchingInterfaces(kUsbPrinterInterfaces);
    if (!interfaces) {
        complain(translated("the USB cannot be looked at"));
        return Exit::Unreachable;
    }
    UsbInterfaceReader reader(registry);
    Array printers;
    while (const auto service = registry.nextInterface(*interfaces))
        printers.emplace_back(usbPrinter(reader, *service));
    output.print(printers, kUsbColumns);
    return Exit::Success;
}

Exit showScanner(const Arguments& arguments, Output& output) {
    if (arguments.operands.size() != 1)
        return usageError(translated("scanner: which description?"));
    Services services;
    UsbEnumeration usb(services.platform(), services.drivers(), services.platform().usb);
    const auto scanner = ScannerObject::scannerObjectWithString(arguments.operands.front(), usb,
                                                                services.platform().computerName);
    if (!scanner) {
        output.printNull();
        complain(translated("not the description of a scanner"));
        return Exit::NotFound;
    }
    output.print(scannerAnswers(*scanner));
    return Exit::Success;
}

Exit showPredicate(const Arguments& arguments, Output& output) {
    if (arguments.operands.empty())
        return usageError(translated("predicate: for which ID?"));
    const auto predicate = DownloadTriggerOperation::predicateForUpdateStrings(arguments.operands);
    if (!predicate) {
        output.printNull();
        return Exit::NotFound;
    }
    output.printText(*predicate);
    return Exit::Success;
}

}  // namespace ventras
