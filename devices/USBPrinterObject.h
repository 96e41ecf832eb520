#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "devices/VentrasPrinterObject.h"

namespace ventras {

class PPDManager;
struct Platform;

/// A printer behind one printer-class interface of the USB, known by its place on the bus and by the IEEE
/// 1284 device ID that it reports. One thread at a time.
class USBPrinterObject final : public VentrasPrinterObject {
public:
    /// The location of a printer whose place is not known.
    static constexpr std::uint32_t kNoLocation = 0xFFFFFFFF;

    USBPrinterObject(Platform& platform, PPDManager& drivers, std::uint32_t location,
                     std::uint8_t interfaceNumber, std::uint16_t vendorID, std::uint16_t productID,
                     std::optional<std::string> deviceID);

    static std::shared_ptr<USBPrinterObject> usbPrinterObjectWithLocation(
        Platform& platform, PPDManager& drivers, std::uint32_t location, std::uint8_t interfaceNumber,
        std::uint16_t vendorID, std::uint16_t productID, std::optional<std::string> deviceID);

    std::uint32_t location() const { return location_; }  ///< UsbRegistry's location
    void setLocation(std::uint32_t location) { location_ = location; }
    std::uint8_t interfaceNumber() const { return interfaceNumber_; }
    void setInterfaceNumber(std::uint8_t number) { interfaceNumber_ = number; }
    std::uint16_t vendorID() const { return vendorID_; }  ///< idVendor
    void setVendorID(std::uint16_t vendorID) { vendorID_ = vendorID; }
    std::uint16_t productID() const { return productID_; }  ///< idProduct
    void setProductID(std::uint16_t productID) { productID_ = productID; }
    const std::optional<std::string>& deviceID() const { return deviceID_; }
    void setDeviceID(std::optional<std::string> deviceID) { deviceID_ = std::move(deviceID); }

    std::optional<std::string> make() const;
    std::optional<std::string> model() const;
    std::optional<std::string> serialNumber() const;

    std::optional<std::string> name() override;
    std::optional<std::string> softwareUpdateScanDeviceID() override;
    bool supportsPCL() override;
    bool supportsPostscript() override;

    /// "usb://make/model?serial=..."; without a serial number "?location=...", and bare where the place is
    /// not known either. Empty when it would be longer than libcups' 1024 bytes.
    std::optional<std::string> deviceURI() override;

    bool matchesIDDevice(const ImageDevice& device) override;
    std::optional<std::string> matchExistingQueues(const QueueRecords& queues) override;
    std::optional<QueueAttributes> driverInfo(const PPDRecord& driver) override;
    std::optional<std::vector<PPDRecord>> driverList() override;

    /// For log lines.
    std::string description() const;

private:
    std::string_view idText() const { return deviceID_ ? *deviceID_ : std::string_view{}; }
    bool mayUseSerialNumber() const;

    Platform& platform_;
    PPDManager& drivers_;
    std::uint32_t location_;
    std::uint8_t interfaceNumber_;
    std::uint16_t vendorID_;
    std::uint16_t productID_;
    std::optional<std::string> deviceID_;
};

}  // namespace ventras
