#include "platform/linux/scanners/UsbScannerWatch.h"

#include <libudev.h>
#include <poll.h>
#include <sys/eventfd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/UsbLocation.h"
#include "platform/linux/ReleaseWith.h"
#include "platform/linux/scanners/NameBasedUUID.h"
#include "platform/linux/scanners/ScannerModules.h"

namespace ventras {
namespace {

using UdevPtr = std::unique_ptr<udev, ReleaseWith<udev_unref>>;
using MonitorPtr = std::unique_ptr<udev_monitor, ReleaseWith<udev_monitor_unref>>;
using DevicePtr = std::unique_ptr<udev_device, ReleaseWith<udev_device_unref>>;
using EnumeratePtr = std::unique_ptr<udev_enumerate, ReleaseWith<udev_enumerate_unref>>;
using HwdbPtr = std::unique_ptr<udev_hwdb, ReleaseWith<udev_hwdb_unref>>;

constexpr const char* kSubsystem = "usb";
constexpr const char* kDeviceType = "usb_device";
constexpr std::string_view kMatched = "libsane_matched";

std::string attribute(udev_device* device, const char* name) {
    const char* value = udev_device_get_sysattr_value(device, name);
    return value == nullptr ? "" : value;
}

template <class Number>
std::optional<Number> number(std::string_view text, int base) {
    Number value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value, base);
    return error == std::errc{} && end == text.data() + text.size() ? std::optional{value} : std::nullopt;
}

// "1.4.2" is port 2 of the hub in port 4 of the hub in port 1; a root hub has "0".
std::vector<std::uint8_t> portsIn(std::string_view path) {
    std::vector<std::uint8_t> ports;
    while (!path.empty()) {
        const auto end = std::min(path.find('.'), path.size());
        ports.push_back(number<std::uint8_t>(path.substr(0, end), 10).value_or(0));
        path.remove_prefix(std::min(end + 1, path.size()));
    }
    return ports;
}

// Without udev's daemon the devices carry no properties, but its database can still be read.
bool isInHardwareDatabase(udev* context, std::uint16_t vendor, std::uint16_t product) {
    const HwdbPtr database{udev_hwdb_new(context)};
    if (!database)
        return false;
    std::array<char, 32> alias{};
    std::snprintf(alias.data(), alias.size(), "usb:v%04Xp%04X", unsigned{vendor}, unsigned{product});
    auto* properties = udev_hwdb_get_properties_list_entry(database.get(), alias.data(), 0);
    const auto* entry = udev_list_entry_get_by_name(properties, kMatched.data());
    const char* value =
        entry == nullptr ? nullptr : udev_list_entry_get_value(const_cast<udev_list_entry*>(entry));
    return value != nullptr && std::string_view(value) == "yes";
}

bool isScanner(udev* context, udev_device* device, const ImageDevice& identity) {
    const char* matched = udev_device_get_property_value(device, kMatched.data());
    return matched != nullptr ? std::string_view(matched) == "yes"
                              : isInHardwareDatabase(context, identity.usbVendor, identity.usbProduct);
}

// A scanner on the USB brings no UUID; this one is the same whenever and wherever the same unit is seen.
// Units without a serial number are told apart by their place.
std::string uuidOf(const ImageDevice& device) {
    const auto unit =
        device.serialNumber.empty() ? "@" + std::to_string(device.usbLocation) : device.serialNumber;
    return nameBasedUUID("usb-scanner:" + std::to_string(device.usbVendor) + ":" +
                         std::to_string(device.usbProduct) + ":" + unit);
}

std::optional<ImageDevice> scannerFrom(udev* context, udev_device* device) {
    const auto vendor = number<std::uint16_t>(attribute(device, "idVendor"), 16);
    const auto product = number<std::uint16_t>(attribute(device, "idProduct"), 16);
    const auto bus = number<std::uint8_t>(attribute(device, "busnum"), 10);
    if (!vendor || !product || !bus)
        return std::nullopt;
    ImageDevice scanner;
    scanner.transport = ImageDeviceTransport::kUSB;
    scanner.usbVendor = *vendor;
    scanner.usbProduct = *product;
    if (!isScanner(context, device, scanner))
        return std::nullopt;
    scanner.usbLocation = usbLocation(*bus, portsIn(attribute(device, "devpath")));
    scanner.serialNumber = attribute(device, "serial");
    scanner.uuidString = uuidOf(scanner);
    scanner.modulePath = scannerModuleForUsb(*vendor, *product);
    return scanner;
}

// Tells each scanner once as it comes and once as it goes: udev may repeat itself.
class Reporter {
public:
    Reporter(udev* context, const UsbScannerWatch::Sink& sink) : context_(context), sink_(sink) {}

    void added(udev_device* device) {
        const std::string key = udev_device_get_syspath(device);
        if (told_.contains(key))
            return;
        if (auto scanner = scannerFrom(context_, device)) {
            told_.insert(key);
            sink_({ScannerEvent::Kind::Added, key, std::move(*scanner)});
        }
    }

    void removed(udev_device* device) {
        const std::string key = udev_device_get_syspath(device);
        if (told_.erase(key) != 0)
            sink_({ScannerEvent::Kind::Removed, key, {}});
    }

private:
    udev* context_;
    const UsbScannerWatch::Sink& sink_;
    std::set<std::string> told_;
};

MonitorPtr newMonitor(udev* context) {
    MonitorPtr monitor{udev_monitor_new_from_netlink(context, "udev")};
    if (monitor &&
        (udev_monitor_filter_add_match_subsystem_devtype(monitor.get(), kSubsystem, kDeviceType) < 0 ||
         udev_monitor_enable_receiving(monitor.get()) < 0))
        monitor.reset();
    return monitor;
}

void tellPresent(udev* context, Reporter& reporter) {
    const EnumeratePtr enumeration{udev_enumerate_new(context)};
    if (!enumeration || udev_enumerate_add_match_subsystem(enumeration.get(), kSubsystem) < 0 ||
        udev_enumerate_scan_devices(enumeration.get()) < 0)
        return;
    for (auto* entry = udev_enumerate_get_list_entry(enumeration.get()); entry != nullptr;
         entry = udev_list_entry_get_next(entry)) {
        const DevicePtr device{udev_device_new_from_syspath(context, udev_list_entry_get_name(entry))};
        const char* type = device ? udev_device_get_devtype(device.get()) : nullptr;
        if (type != nullptr && std::string_view(type) == kDeviceType)
            reporter.added(device.get());
    }
}

void tellChange(udev_monitor* monitor, Reporter& reporter) {
    const DevicePtr device{udev_monitor_receive_device(monitor)};
    const char* action = device ? udev_device_get_action(device.get()) : nullptr;
    if (action == nullptr)
        return;
    if (std::string_view(action) == "add")
        reporter.added(device.get());
    else if (std::string_view(action) == "remove")
        reporter.removed(device.get());
}

}  // namespace

UsbScannerWatch::UsbScannerWatch(Sink sink)
    : sink_(std::move(sink)), stop_(eventfd(0, EFD_CLOEXEC)), thread_([this] { watch(); }) {}

UsbScannerWatch::~UsbScannerWatch() {
    eventfd_write(stop_.get(), 1);
}

void UsbScannerWatch::watch() {
    const UdevPtr context{udev_new()};
    // The monitor comes before the look around, so that no device slips through between the two.
    const auto monitor = context ? newMonitor(context.get()) : nullptr;
    Reporter reporter(context.get(), sink_);
    if (context)
        tellPresent(context.get(), reporter);
    firstLook_.count_down();
    if (!monitor)
        return;

    std::array<pollfd, 2> sources{pollfd{stop_.get(), POLLIN, 0},
                                  pollfd{udev_monitor_get_fd(monitor.get()), POLLIN, 0}};
    while (poll(sources.data(), sources.size(), -1) >= 0 || errno == EINTR) {
        if (sources[0].revents != 0)
            return;
        if (sources[1].revents != 0)
            tellChange(monitor.get(), reporter);
    }
}

}  // namespace ventras
