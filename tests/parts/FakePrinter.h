#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "Hook.h"

namespace ventras {

using UsbBytes = std::vector<std::uint8_t>;

/// The setup packet of a control request (USB 2.0 section 9.3).
struct UsbSetup {
    std::uint8_t bmRequestType = 0;
    std::uint8_t bRequest = 0;
    std::uint16_t wValue = 0;
    std::uint16_t wIndex = 0;
    std::uint16_t wLength = 0;

    /// @param packet its 8 bytes as they go over the bus
    static UsbSetup parse(const std::uint8_t* packet);

    bool operator==(const UsbSetup&) const = default;
};

/// What a device does with a request.
struct UsbAnswer {
    int error = 0;  ///< errno of the transfer: EPIPE is a STALL, ETIMEDOUT no answer ever
    UsbBytes data;  ///< what it sends
    std::chrono::milliseconds after{0};  ///< how long it takes

    static UsbAnswer stall();
    static UsbAnswer silence();
    static UsbAnswer text(std::string_view bytes);
    /// A device ID with a length field of its own.
    static UsbAnswer deviceID(std::uint16_t length, std::string_view text);
};

/// One setting of one interface.
struct FakeUsbSetting {
    std::uint8_t interface = 0;
    std::uint8_t alternate = 0;
    std::uint8_t interfaceClass = 7;
    std::uint8_t subClass = 1;
    std::uint8_t protocol = 2;  ///< 2 = bidirectional, 4 = IPP over USB
};

/// What a FakePrinter is.
struct FakePrinterModel {
    std::uint16_t vendor = 0x0912;
    std::uint16_t product = 0x0001;
    std::string deviceID = "MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;";
    std::map<std::uint8_t, std::string> deviceIDs{};  ///< for interfaces whose ID differs
    std::string manufacturer{};  ///< string descriptors 1 to 3, UTF-8; empty = the device has none
    std::string productName{};
    std::string serialNumber{};
    std::vector<FakeUsbSetting> settings{{}};
    std::uint8_t configuration = 1;  ///< 0 = not configured
    bool isScanner = false;          ///< whether the scanner driver collection knows the device
};

/// A USB printer without a bus: descriptors, control requests, bulk endpoints, alternate settings, and a hook
/// for faults. Transports put it behind a registry in memory, behind libusb, or behind a kernel. Any thread
/// may use it.
class FakePrinter {
public:
    explicit FakePrinter(FakePrinterModel model = {}) : model_(std::move(model)) {}

    /// Looks at every control request first; what it returns is the answer.
    Hook<std::optional<UsbAnswer>(const UsbSetup&)> fault;

    /// The same for bulk transfers; its argument is the endpoint address.
    Hook<std::optional<UsbAnswer>(std::uint8_t)> bulkFault;

    /// Takes what arrives at a bulk endpoint and gives what the device says to it; asked with nothing, too.
    Hook<std::string(std::string_view)> interpreter;

    /// The same for settings of IPP over USB; its first argument is the interface.
    Hook<std::string(std::uint8_t, std::string_view)> http;

    const FakePrinterModel& model() const { return model_; }

    UsbBytes deviceDescriptor() const;
    UsbBytes configurationDescriptor() const;

    UsbAnswer control(const UsbSetup& setup);
    UsbAnswer bulkOut(std::uint8_t endpoint, std::string_view data);
    /// Absent while the device has nothing to say.
    std::optional<UsbAnswer> bulkIn(std::uint8_t endpoint, std::size_t most);

    std::uint8_t currentSetting(std::uint8_t interface) const;
    /// The description of an interface's setting; null when there is none.
    const FakeUsbSetting* setting(std::uint8_t interface, std::uint8_t alternate) const;

    std::vector<UsbSetup> requests() const;  ///< every control request so far
    std::string received() const;            ///< everything that reached a bulk endpoint

    /// Waits for a text at a bulk endpoint. @return false when it has not come within `limit`.
    bool receives(std::string_view text, std::chrono::milliseconds limit = std::chrono::seconds(30)) const;

private:
    UsbAnswer answer(const UsbSetup& setup);
    UsbAnswer descriptor(const UsbSetup& setup) const;
    UsbBytes stringDescriptor(std::uint8_t index) const;
    std::uint8_t settingInUse(std::uint8_t interface) const;
    const FakeUsbSetting* settingAt(std::uint8_t endpoint) const;
    std::string reaction(const FakeUsbSetting& at, std::string_view data);

    FakePrinterModel model_;
    mutable std::mutex mutex_;
    std::map<std::uint8_t, std::uint8_t> currentSettings_;
    std::vector<UsbSetup> requests_;
    std::string received_;
    std::map<std::uint8_t, std::string> toSend_;  // by interface
};

/// What ends the raster graphics of a page in PCL.
inline constexpr const char* kEndOfPclPage = "\x1b*r0B";

/// The requests that the tests look for.
bool isGetDeviceID(const UsbSetup& setup);
bool isGetDeviceDescriptor(const UsbSetup& setup);
bool isGetString(const UsbSetup& setup, std::uint8_t index);

}  // namespace ventras
