#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "devices/VentrasPrinterObject.h"

namespace ventras {

class ComputerName;
class UsbEnumeration;
class USBPrinterObject;

/// A scanner as the image-capture system describes it, and the printer half of its device where there is one.
/// One thread at a time.
class ScannerObject final : public VentrasPrinterObject {
public:
    /// Bits of type().
    static constexpr std::uint64_t kLocalScanner = 0x100;   ///< USB and FireWire
    static constexpr std::uint64_t kSharedScanner = 0x200;  ///< served by another computer
    static constexpr std::uint64_t kNetworkScanner = 0x400;

    /// Reads a scanner's description: fields separated by ",", without quoting.
    ///
    /// USB: UUID, persistent ID, name, icon path, "USB", location, product, vendor (decimal), and optionally
    /// the path of the driver module. FireWire: the first four, "FireWire", GUID (decimal), and optionally
    /// the path.
    /// @param usb looks for the printer half of a USB scanner
    /// @return null for any other form; network scanners have none.
    static std::shared_ptr<ScannerObject> scannerObjectWithString(std::string_view description,
                                                                  UsbEnumeration& usb,
                                                                  ComputerName& computerName);

    /// A scanner on the USB, on FireWire, and on the network.
    ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID,
                  std::uint32_t location, std::uint32_t product, std::uint32_t vendor);
    ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID, std::int64_t guid);
    ScannerObject(ComputerName& computerName, std::string uuid, std::string persistentID,
                  std::string serviceName);

    const std::string& uuidString() const { return uuidString_; }
    const std::string& persistentID() const { return persistentID_; }
    const std::string& transportType() const { return transportType_; }  ///< an ImageDeviceTransport
    std::optional<std::string> name() override { return name_; }
    void setName(std::optional<std::string> name) { name_ = std::move(name); }
    const std::optional<std::string>& iconPath() const { return iconPath_; }
    void setIconPath(std::optional<std::string> path) { iconPath_ = std::move(path); }
    const std::optional<std::string>& modulePath() const { return modulePath_; }
    void setModulePath(std::optional<std::string> path) { modulePath_ = std::move(path); }
    std::uint64_t type() const { return type_; }
    void setType(std::uint64_t type) { type_ = type; }
    std::uint32_t usbLocationID() const { return usbLocationID_; }
    std::uint32_t usbProductID() const { return usbProductID_; }
    std::uint32_t usbVendorID() const { return usbVendorID_; }
    std::int64_t fwGUID() const { return fwGUID_; }
    const std::string& corvidServiceName() const { return corvidServiceName_; }

    /// The printer half of a multifunction device; null for a scanner only.
    const std::shared_ptr<USBPrinterObject>& printer() const { return printer_; }
    void setPrinter(std::shared_ptr<USBPrinterObject> printer) { printer_ = std::move(printer); }
    bool isMFP() const { return printer_ != nullptr; }

    /// "usb://UUID" for USB and FireWire alike; by other transports "mdns://", "bluetooth://", or no device.
    std::optional<std::string> deviceURI() override;

    /// Location of the queue for people: the computer for scanners that hang on it, else "".
    std::optional<std::string> deviceLocation() const;

    /// Writes a PPD (Adobe PPD 4.3) by which a queue stands for this scanner and prints nothing. The values
    /// go into it as they stand; the print system refuses a file that they break.
    /// @return path of a new temporary file that the caller deletes; absent when it cannot be written.
    std::optional<std::string> ppdFile() const;

    /// For log lines.
    std::string description() const;

private:
    ComputerName& computerName_;
    std::string uuidString_;
    std::string persistentID_;
    std::string transportType_;
    std::optional<std::string> name_;
    std::optional<std::string> iconPath_;
    std::optional<std::string> modulePath_;
    std::uint64_t type_;
    std::uint32_t usbLocationID_ = 0;
    std::uint32_t usbProductID_ = 0;
    std::uint32_t usbVendorID_ = 0;
    std::shared_ptr<USBPrinterObject> printer_;
    std::int64_t fwGUID_ = 0;
    std::string corvidServiceName_;
};

}  // namespace ventras
