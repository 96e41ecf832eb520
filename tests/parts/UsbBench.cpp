#include "tests/parts/UsbBench.h"

#include <umockdev.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <utility>

namespace ventras {
namespace {

constexpr const char* kPreload = "libumockdev-preload.so.0";
constexpr std::size_t kLongestTemporaryFolder = 40;

/// A hub's device and configuration descriptors.
UsbBytes hubDescriptors() {
    return {18, 1, 0,  2, 9, 0, 1, 64,   0x6b, 0x1d, 2, 0, 0, 6, 0, 0, 0, 1,  //
            9,  2, 25, 0, 1, 1, 0, 0xe0, 0,    9,    4, 0, 0, 1, 9, 0, 0, 0, 7, 5, 0x81, 3, 4, 0, 12};
}

std::string hexadecimal(const UsbBytes& bytes) {
    std::string text;
    std::array<char, 3> digits{};
    for (const auto byte : bytes) {
        std::snprintf(digits.data(), digits.size(), "%02X", byte);
        text += digits.data();
    }
    return text;
}

std::string hexadecimal(std::uint8_t byte) {
    return hexadecimal(UsbBytes{byte});
}

// As the kernel writes vendors and products.
std::string identifier(std::uint16_t number) {
    std::array<char, 5> digits{};
    std::snprintf(digits.data(), digits.size(), "%04x", unsigned{number});
    return digits.data();
}

int busOf(const std::string& place) {
    return std::stoi(place);
}

std::string portsOf(const std::string& place) {
    return place.substr(place.find('-') + 1);
}

bool isRootHub(const std::string& place) {
    return place.ends_with("-0");
}

/// The hub that a place hangs on, written as a place; the root hub is "1-0".
std::string parentOf(const std::string& place) {
    const auto dot = place.rfind('.');
    return dot == std::string::npos ? place.substr(0, place.find('-')) + "-0" : place.substr(0, dot);
}

std::string systemPathOf(const std::string& place) {
    const auto bus = std::to_string(busOf(place));
    if (isRootHub(place))
        return "/devices/pci0000:00/0000:00:14." + bus + "/usb" + bus;
    return systemPathOf(parentOf(place)) + "/" + place;
}

/// As udev's usb_id writes it, over every setting: ":070102:070104:".
std::string interfaceList(const FakePrinterModel& model) {
    std::string list = ":";
    for (const auto& setting : model.settings) {
        std::string entry = hexadecimal({setting.interfaceClass, setting.subClass, setting.protocol});
        for (char& c : entry)
            c = c >= 'A' && c <= 'F' ? static_cast<char>(c - 'A' + 'a') : c;
        if (list.find(":" + entry + ":") == std::string::npos)
            list += entry + ":";
    }
    return list;
}

std::string attribute(const std::string& name, const std::string& value) {
    return value.empty() ? "" : "A: " + name + "=" + value + "\\n\n";
}

std::string withAddition(const char* variable, const std::string& separator, const std::string& addition) {
    const char* present = std::getenv(variable);
    return present == nullptr || *present == '\0' ? addition : addition + separator + present;
}

bool isEntered() {
    const char* preloaded = std::getenv("LD_PRELOAD");
    return preloaded != nullptr && std::string_view(preloaded).find(kPreload) != std::string_view::npos;
}

}  // namespace

void UsbBench::enter(char** arguments) {
    if (isEntered())
        return;
    setenv("LD_PRELOAD", withAddition("LD_PRELOAD", ":", kPreload).c_str(), 1);
    // The sanitizer wants to be the first library of a process; it works as the second one too.
    setenv("ASAN_OPTIONS", withAddition("ASAN_OPTIONS", ":", "verify_asan_link_order=0").c_str(), 1);
    execv("/proc/self/exe", arguments);
    throw std::runtime_error("cannot start again inside umockdev");
}

UsbBench::UsbBench() {
    // The path of the emulation's sockets must fit into a socket address.
    const char* temporary = std::getenv("TMPDIR");
    if (temporary != nullptr && std::string_view(temporary).size() > kLongestTemporaryFolder)
        setenv("TMPDIR", "/tmp", 1);
    testbed_ = umockdev_testbed_new();
}

UsbBench::~UsbBench() {
    while (!printers_.empty())
        unplug(printers_.begin()->first);
    for (const auto& attached : unplugged_)
        umockdev_testbed_detach_ioctl(testbed_, attached.nodePath.c_str(), nullptr);
    g_object_unref(testbed_);
}

Environment UsbBench::environment() const {
    const char* folder = std::getenv("UMOCKDEV_DIR");
    return {{"LD_PRELOAD", kPreload},
            {"UMOCKDEV_DIR", folder == nullptr ? "" : folder},
            {"ASAN_OPTIONS", withAddition("ASAN_OPTIONS", ":", "verify_asan_link_order=0")}};
}

std::string UsbBench::add(const std::string& place, const UsbBytes& descriptors, const std::string& more) {
    const int bus = busOf(place);
    const int number = ++lastDeviceNumber_[bus];
    std::array<char, 32> node{};
    std::snprintf(node.data(), node.size(), "bus/usb/%03d/%03d", bus, number);
    const auto digits = [&](std::size_t at) { return std::string(node.data() + at, 3); };
    const std::string description =
        "P: " + systemPathOf(place) + "\nN: " + node.data() + "\nE: DEVNAME=/dev/" + node.data() +
        "\nE: DEVTYPE=usb_device\nE: MAJOR=189\nE: MINOR=" + std::to_string((bus - 1) * 128 + number - 1) +
        "\nE: BUSNUM=" + digits(8) + "\nE: DEVNUM=" + digits(12) + "\nE: SUBSYSTEM=usb\n" +
        "A: busnum=" + std::to_string(bus) + "\\n\nA: devnum=" + std::to_string(number) + "\\n\n" +
        "A: devpath=" + (isRootHub(place) ? "0" : portsOf(place)) + "\\n\nA: speed=480\\n\n" + more +
        "H: descriptors=" + hexadecimal(descriptors) + "\n";
    GError* error = nullptr;
    if (!umockdev_testbed_add_from_string(testbed_, description.c_str(), &error)) {
        const std::string reason = error->message;
        g_error_free(error);
        throw std::runtime_error(place + ": " + reason);
    }
    return "/dev/" + std::string(node.data());
}

void UsbBench::addHub(const std::string& place) {
    if (!hubs_.insert(place).second)
        return;
    if (!isRootHub(place))
        addHub(parentOf(place));
    add(place, hubDescriptors(), "A: bConfigurationValue=1\\n\n");
}

std::vector<std::string> UsbBench::addInterfaces(const std::string& place, const FakePrinter& printer) {
    const auto& model = printer.model();
    std::vector<std::string> paths;
    for (const auto& setting : model.settings) {
        if (setting.alternate != 0 || model.configuration == 0)
            continue;
        const std::string name =
            place + ":" + std::to_string(model.configuration) + "." + std::to_string(setting.interface);
        const std::string description =
            "P: " + systemPathOf(place) + "/" + name + "\nE: DEVTYPE=usb_interface\nE: SUBSYSTEM=usb\n" +
            "A: bAlternateSetting= 0\\n\nA: bInterfaceNumber=" + hexadecimal(setting.interface) +
            "\\n\nA: bInterfaceClass=" + hexadecimal(setting.interfaceClass) + "\\n\n";
        umockdev_testbed_add_from_string(testbed_, description.c_str(), nullptr);
        paths.push_back("/sys" + systemPathOf(place) + "/" + name);
    }
    return paths;
}

// Only inside can umockdev read what it announces, and only there does anybody listen for long.
void UsbBench::announce(const std::string& systemPath, const char* action) {
    if (isEntered())
        umockdev_testbed_uevent(testbed_, systemPath.c_str(), action);
}

FakePrinter& UsbBench::plugIn(const std::string& place, FakePrinterModel model) {
    addHub(parentOf(place));
    auto printer = std::make_unique<FakePrinter>(std::move(model));
    const auto& made = printer->model();
    auto descriptors = printer->deviceDescriptor();
    const auto configuration = printer->configurationDescriptor();
    descriptors.insert(descriptors.end(), configuration.begin(), configuration.end());
    const auto number = made.configuration == 0 ? "" : std::to_string(made.configuration);
    const auto nodePath = add(
        place, descriptors,
        "E: ID_USB_INTERFACES=" + interfaceList(made) + "\n" +
            (made.isScanner ? "E: libsane_matched=yes\n" : "") + "A: bConfigurationValue=" + number +
            "\\n\n" + attribute("idVendor", identifier(made.vendor)) +
            attribute("idProduct", identifier(made.product)) + attribute("manufacturer", made.manufacturer) +
            attribute("product", made.productName) + attribute("serial", made.serialNumber));
    auto interfaces = addInterfaces(place, *printer);

    auto node = std::make_unique<UsbNode>(*printer);
    node->onSetInterface = [this, place](std::uint8_t interface, std::uint8_t alternate) {
        const auto path = sysPath(place) + "/" + place + ":" +
                          std::to_string(printers_.at(place).printer->model().configuration) + "." +
                          std::to_string(interface);
        umockdev_testbed_set_attribute(testbed_, path.c_str(), "bAlternateSetting",
                                       (" " + std::to_string(alternate) + "\n").c_str());
    };
    umockdev_testbed_attach_ioctl(testbed_, nodePath.c_str(), node->handler(), nullptr);
    auto& attached = printers_[place];
    attached = {"/sys" + systemPathOf(place), nodePath, std::move(interfaces), std::move(printer),
                std::move(node)};
    announce(attached.systemPath, "add");
    return *attached.printer;
}

UsbNode& UsbBench::node(const std::string& place) {
    return *printers_.at(place).node;
}

void UsbBench::unplug(const std::string& place) {
    auto& attached = printers_.at(place);
    attached.node->unplug();
    announce(attached.systemPath, "remove");
    for (const auto& interface : attached.interfacePaths)
        umockdev_testbed_remove_device(testbed_, interface.c_str());
    umockdev_testbed_remove_device(testbed_, attached.systemPath.c_str());
    unplugged_.push_back(std::move(attached));
    printers_.erase(place);
}

std::string UsbBench::nodePath(const std::string& place) const {
    return printers_.at(place).nodePath;
}

std::string UsbBench::nodeFile(const std::string& place) const {
    gchar* root = umockdev_testbed_get_root_dir(testbed_);
    const std::string path = root + nodePath(place);
    g_free(root);
    return path;
}

std::string UsbBench::sysPath(const std::string& place) const {
    return printers_.at(place).systemPath;
}

}  // namespace ventras
