#pragma once

#include <libusb.h>

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

#include "platform/UsbRegistry.h"

namespace ventras {

namespace detail {
struct CloseLibusbHandle {
    void operator()(libusb_device_handle* handle) const { libusb_close(handle); }
};
}  // namespace detail

/// Owner of an open device.
using LibusbHandle = std::unique_ptr<libusb_device_handle, detail::CloseLibusbHandle>;

/// One setting of an interface.
struct LibusbSetting {
    UsbInterfaceDescriptor descriptor;
    std::optional<std::uint8_t> bulkOut;  ///< address of its first bulk endpoint to the device
    std::optional<std::uint8_t> bulkIn;   ///< and from it

    bool matches(const UsbInterfaceMatch& match) const;
};

/// One interface with all its settings, in the order of the configuration.
struct LibusbInterface {
    std::uint8_t number = 0;
    std::vector<LibusbSetting> settings;

    /// Whether one of the settings, current or not, is of that class.
    bool hasSetting(const UsbInterfaceMatch& match) const;

    /// Null when there is none of that number.
    const LibusbSetting* setting(std::uint8_t alternate) const;
};

/// What the kernel tells of a configured device without anybody opening it. A plain value; it keeps libusb's
/// device alive, so it must go before the LibusbContext that gave it.
struct LibusbDevice {
    std::shared_ptr<libusb_device> device;
    std::uint32_t location = 0;
    std::uint16_t vendor = 0;
    std::uint16_t product = 0;
    std::uint8_t configuration = 0;
    std::vector<LibusbInterface> interfaces;

    /// The setting that an interface is in at present.
    std::uint8_t currentSetting(std::uint8_t interface) const;

    /// Null when the user may not use the device, or it is gone; `error` then says which, as libusb does.
    LibusbHandle open(int& error) const;
};

using LibusbDevicePtr = std::shared_ptr<const LibusbDevice>;

/// libusb, from the first time that somebody asks for devices. Any thread may ask.
class LibusbContext {
public:
    LibusbContext() = default;
    LibusbContext(const LibusbContext&) = delete;
    LibusbContext& operator=(const LibusbContext&) = delete;
    ~LibusbContext();

    /// The configured devices, ordered by location. @return absent when they cannot be listed.
    std::optional<std::vector<LibusbDevicePtr>> devices();

private:
    libusb_context* context();

    std::once_flag once_;
    libusb_context* context_ = nullptr;
};

}  // namespace ventras
