#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// How an image device is attached.
namespace ImageDeviceTransport {
inline constexpr std::string_view kUSB = "USB";
inline constexpr std::string_view kFireWire = "FireWire";
inline constexpr std::string_view kTCPIP = "TCP/IP";
inline constexpr std::string_view kBluetooth = "Bluetooth";
}  // namespace ImageDeviceTransport

/// Bits of the kinds of devices that are looked for.
namespace ImageDeviceTypes {
inline constexpr std::uint64_t kScanners = 0x2;
inline constexpr std::uint64_t kReachable = 0x100;  ///< those that this computer reaches by itself
/// Also those that are registered on this very computer, as the scanners of IPP-over-USB devices are.
inline constexpr std::uint64_t kRegisteredHere = 0xfe00;
}  // namespace ImageDeviceTypes

/// One scanner or multifunction device that the image-capture system announces.
struct ImageDevice {
    std::string transport;          ///< one of ImageDeviceTransport
    std::uint32_t usbLocation = 0;  ///< UsbRegistry's location; USB only
    std::uint16_t usbVendor = 0;    ///< idVendor; USB only
    std::uint16_t usbProduct = 0;   ///< idProduct; USB only
    std::string serialNumber;       ///< empty when the device has none
    std::string txtRecord;          ///< raw bytes of the DNS-SD TXT record (RFC 6763 section 6); TCP/IP only
    std::string uuidString;
    std::optional<std::string> modulePath;  ///< the driver module that serves the device
};

/// Watches for scanners and multifunction devices. Main thread only; never blocks.
class ImageDeviceBrowser {
public:
    /// Hears of devices as they come and go, on the main thread.
    class Delegate {
    public:
        virtual ~Delegate() = default;
        virtual void deviceAdded(const ImageDevice& device) = 0;
        virtual void deviceRemoved(const ImageDevice& device) = 0;
    };

    virtual ~ImageDeviceBrowser() = default;

    /// @param delegate not owned; outlives the browser or is replaced by null
    virtual void setDelegate(Delegate* delegate) = 0;

    /// The kinds of devices to look for: a set of ImageDeviceTypes.
    virtual void setBrowsedDeviceTypeMask(std::uint64_t mask) = 0;
    virtual std::uint64_t browsedDeviceTypeMask() const = 0;

    virtual void start() = 0;

    /// The devices known at present, in the order in which they were announced.
    virtual std::vector<ImageDevice> devices() const = 0;

    /// Tells the image-capture system that new device software was installed.
    virtual void announceNewSoftwareInstalled() = 0;
};

}  // namespace ventras
