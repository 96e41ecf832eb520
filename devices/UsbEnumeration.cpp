#include "devices/UsbEnumeration.h"

#include <algorithm>
#include <utility>

#include "devices/UsbInterfaceReader.h"

namespace ventras {

std::vector<UsbEnumeration::PrinterPtr> UsbEnumeration::printerObjects(const LocationFilter& filter) {
    std::vector<PrinterPtr> printers;
    const auto interfaces = registry_.matchingInterfaces(kUsbPrinterInterfaces);
    if (!interfaces)
        return printers;
    while (const auto service = registry_.nextInterface(*interfaces))
        if (auto printer = printerObjectForInterface(*service, filter))
            printers.push_back(std::move(printer));
    return printers;
}

UsbEnumeration::PrinterPtr UsbEnumeration::printerObjectForScanner(std::uint32_t location,
                                                                   std::uint32_t vendor,
                                                                   std::uint32_t product) {
    // Numbers out of a description are wider than those of any device.
    if (!std::in_range<std::uint16_t>(vendor) || !std::in_range<std::uint16_t>(product))
        return nullptr;
    const auto interfaces = registry_.matchingInterfaces(kUsbPrinterInterfaces);
    if (!interfaces)
        return nullptr;
    while (const auto service = registry_.nextInterface(*interfaces))
        if (auto printer = printerObjectForScannerLocation(
                *service, location, static_cast<std::uint16_t>(vendor), static_cast<std::uint16_t>(product)))
            return printer;
    return nullptr;
}

UsbEnumeration::PrinterPtr UsbEnumeration::printerObjectForInterface(const UsbInterfaceService& service,
                                                                     const LocationFilter& filter) {
    UsbInterfaceReader reader(registry_);
    const auto identity = reader.readIdentity(service);
    if (identity.location.value_or(USBPrinterObject::kNoLocation) == USBPrinterObject::kNoLocation)
        return nullptr;
    const auto place = std::to_string(*identity.location) + "," + std::to_string(identity.interfaceNumber);
    if (std::ranges::find(filter, place) == filter.end())
        return nullptr;
    const auto deviceID = reader.readDeviceID(service);
    const auto ippOverUSB = reader.listIPPOverUSBInterfaces(service, deviceID);
    if (!deviceID || ippOverUSB)
        return nullptr;
    return USBPrinterObject::usbPrinterObjectWithLocation(platform_, drivers_, *identity.location,
                                                          identity.interfaceNumber, identity.vendorID,
                                                          identity.productID, deviceID);
}

UsbEnumeration::PrinterPtr UsbEnumeration::printerObjectForScannerLocation(const UsbInterfaceService& service,
                                                                           std::uint32_t location,
                                                                           std::uint16_t vendor,
                                                                           std::uint16_t product) {
    UsbInterfaceReader reader(registry_);
    const auto identity = reader.readIdentity(service);
    if (identity.location.value_or(0) != location || identity.vendorID != vendor ||
        identity.productID != product)
        return nullptr;
    auto deviceID = reader.readDeviceID(service);
    if (!deviceID)
        return nullptr;
    return USBPrinterObject::usbPrinterObjectWithLocation(platform_, drivers_, location, 0, vendor, product,
                                                          std::move(deviceID));
}

}  // namespace ventras
