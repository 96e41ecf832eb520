#include "devices/ScannerObject.h"

#include <array>
#include <utility>
#include <vector>

#include "deviceid/DecimalText.h"
#include "deviceid/TextScan.h"
#include "devices/ScannerPPD.h"
#include "devices/USBPrinterObject.h"
#include "devices/UsbEnumeration.h"
#include "platform/ComputerName.h"
#include "platform/ImageDeviceBrowser.h"

namespace ventras {
namespace {

constexpr std::size_t kTransportField = 4;

struct Scheme {
    std::string_view transport, prefix;
};

constexpr std::array kSchemes{
    Scheme{ImageDeviceTransport::kTCPIP, "mdns://"},
    Scheme{ImageDeviceTransport::kUSB, "usb://"},
    Scheme{ImageDeviceTransport::kFireWire, "usb://"},
    Scheme{ImageDeviceTransport::kBluetooth, "bluetooth://"},
};

std::vector<std::string> split(std::string_view description) {
    std::vector<std::string> fields;
    TextScan::Components parts(description, ",");
    while (const auto part = parts.next())
        fields.emplace_back(*part);
    return fields;
}

std::uint32_t number(const std::string& field) {
    return static_cast<std::uint32_t>(leadingInteger32(field));
}

bool isTransport(const std::string& text, std::string_view transport) {
    return TextScan::equalsIgnoringCase(text, transport);
}

}  // namespace

std::shared_ptr<ScannerObject> ScannerObject::scannerObjectWithString(std::string_view description,
                                                                      UsbEnumeration& usb,
                                                                      ComputerName& computerName) {
    const auto fields = split(description);
    const auto count = fields.size();
    const auto transport = count > kTransportField ? fields[kTransportField] : std::string{};
    std::shared_ptr<ScannerObject> scanner;
    bool hasModulePath = false;
    if (isTransport(transport, ImageDeviceTransport::kUSB) && (count == 8 || count == 9)) {
        scanner = std::make_shared<ScannerObject>(computerName, fields[0], fields[1], number(fields[5]),
                                                  number(fields[6]), number(fields[7]));
        scanner->setPrinter(usb.printerObjectForScanner(scanner->usbLocationID(), scanner->usbVendorID(),
                                                        scanner->usbProductID()));
        hasModulePath = count == 9;
    } else if (isTransport(transport, ImageDeviceTransport::kFireWire) && (count == 6 || count == 7)) {
        scanner =
            std::make_shared<ScannerObject>(computerName, fields[0], fields[1], leadingInteger64(fields[5]));
        hasModulePath = count == 7;
    }
    if (!scanner)
        return nullptr;
    scanner->setName(fields[2]);
    scanner->setIconPath(fields[3]);
    if (hasModulePath)
        scanner->setModulePath(fields.back());
    return scanner;
}

ScannerObject::ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID,
                             std::uint32_t location, std::uint32_t product, std::uint32_t vendor)
    : computerName_(computerName),
      uuidString_(std::move(uuid)),
      persistentID_(std::move(persistentID)),
      transportType_(ImageDeviceTransport::kUSB),
      type_(kLocalScanner),
      usbLocationID_(location),
      usbProductID_(product),
      usbVendorID_(vendor) {}

ScannerObject::ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID,
                             std::int64_t guid)
    : computerName_(computerName),
      uuidString_(std::move(uuid)),
      persistentID_(std::move(persistentID)),
      transportType_(ImageDeviceTransport::kFireWire),
      type_(kLocalScanner),
      fwGUID_(guid) {}

ScannerObject::ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID,
                             std::string serviceName)
    : computerName_(computerName),
      uuidString_(std::move(uuid)),
      persistentID_(std::move(persistentID)),
      transportType_(ImageDeviceTransport::kTCPIP),
      type_(kNetworkScanner),
      corvidServiceName_(std::move(serviceName)) {}

std::optional<std::string> ScannerObject::deviceURI() {
    for (const auto& [transport, prefix] : kSchemes)
        if (transportType_ == transport)
            return std::string(prefix) + uuidString_;
    return "file:///dev/null";
}

std::optional<std::string> ScannerObject::deviceLocation() const {
    const bool hangsOnComputer =
        transportType_ == ImageDeviceTransport::kUSB || transportType_ == ImageDeviceTransport::kFireWire;
    return hangsOnComputer ? computerName_.computerName() : "";
}

std::optional<std::string> ScannerObject::ppdFile() const {
    return writeScannerPPD({
        .model = name_.value_or("Scanner"),
        .uuid = uuidString_,
        .persistentID = persistentID_,
        .modulePath = modulePath_,
        .iconPath = iconPath_,
        .isShared = (type_ & kSharedScanner) != 0,
    });
}

std::string ScannerObject::description() const {
    const auto identity = " [" + uuidString_ + "]";
    // The slots of vendor and product have always been crossed in this line.
    if (isTransport(transportType_, ImageDeviceTransport::kUSB))
        return "usb:[loc:" + std::to_string(static_cast<std::int32_t>(usbLocationID_)) +
               " vend:" + std::to_string(static_cast<std::int32_t>(usbProductID_)) +
               " prod:" + std::to_string(static_cast<std::int32_t>(usbVendorID_)) + "]" + identity;
    if (isTransport(transportType_, ImageDeviceTransport::kFireWire))
        return "firewire:" + std::to_string(fwGUID_) + identity;
    if (isTransport(transportType_, ImageDeviceTransport::kTCPIP))
        return "Corvid:" + corvidServiceName_ + identity;
    return "scanner" + identity;
}

}  // namespace ventras
