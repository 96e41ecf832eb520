#include "ctl/Evidence.h"

#include "ctl/Records.h"
#include "deviceid/PMStringAdditions.h"
#include "devices/IPPUSBObject.h"
#include "devices/ScannerObject.h"
#include "devices/USBPrinterObject.h"
#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDMatching.h"

namespace ventras {
namespace {

Evidence evidence(VellumProfilePrinterObject& printer) {
    return {"VellumProfilePrinterObject", {{"attributes", objectOf(printer.attributes())}}};
}

Evidence evidence(IPPUSBObject& printer) {
    const auto& known = printer.txtDictionary();
    return {"IPPUSBObject",
            {{"registeredName", printer.registeredName()},
             {"txtDictionary", known ? Value{objectOf(*known)} : Value{}}}};
}

Evidence evidence(USBPrinterObject& printer) {
    return {"USBPrinterObject",
            {{"location", printer.location()},
             {"interfaceNumber", printer.interfaceNumber()},
             {"vendorID", printer.vendorID()},
             {"productID", printer.productID()},
             {"deviceID", printer.deviceID()}}};
}

Evidence evidence(ScannerObject& scanner) {
    return {"ScannerObject",
            {{"uuidString", scanner.uuidString()},
             {"persistentID", scanner.persistentID()},
             {"transportType", scanner.transportType()},
             {"modulePath", scanner.modulePath()},
             {"isMFP", scanner.isMFP()}}};
}

template <typename... Kinds>
Evidence firstEvidence(VentrasPrinterObject& device) {
    Evidence found;
    const auto take = [&found](auto* kind) {
        if (kind != nullptr)
            found = evidence(*kind);
        return kind != nullptr;
    };
    (take(dynamic_cast<Kinds*>(&device)) || ...);
    return found;
}

std::string_view reasonFor(VentrasPrinterObject& device, const PPDRecord& driver) {
    const auto* usb = dynamic_cast<USBPrinterObject*>(&device);
    if (usb == nullptr)
        return "it is the driver for all driverless printers";
    const auto product = PMStringAdditions::product(usb->deviceID().value_or(""));
    const auto reason = DeviceToMatch(usb->deviceID(), usb->model(), product).match(driver);
    return reason ? describe(*reason) : "";
}

}  // namespace

Evidence evidenceOf(VentrasPrinterObject& device) {
    return firstEvidence<VellumProfilePrinterObject, IPPUSBObject, USBPrinterObject, ScannerObject>(device);
}

Array driversFor(VentrasPrinterObject& device) {
    Array drivers;
    for (const auto& driver : device.driverList().value_or(std::vector<PPDRecord>{}))
        drivers.push_back(Object{{"record", objectOf(driver)},
                                 {"kind", unsigned{PPDKind::of(driver)}},
                                 {"reason", reasonFor(device, driver)}});
    return drivers;
}

Object objectOf(const DeviceDescription& description) {
    return {description.begin(), description.end()};
}

}  // namespace ventras
