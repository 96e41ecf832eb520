#include "tests/kernel/VhciPort.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

// The controller's only high-speed bus, on a machine that has no other controller.
constexpr const char* kDevices = "/sys/bus/usb/devices/1-";
constexpr const char* kAttach = "/sys/devices/platform/vhci_hcd.0/attach";

constexpr int kRemoteDevice = 0x00010002;
constexpr int kHighSpeed = 3;
constexpr auto kLimit = 20s;

/// A port is free a moment after its device has gone.
bool attach(int socket, int port) {
    std::ofstream file(kAttach);
    file << port - 1 << ' ' << socket << ' ' << kRemoteDevice << ' ' << kHighSpeed << std::flush;
    return file.good();
}

/// Which settings the kernel's printer driver takes: all but IPP over USB.
bool isForKernelDriver(const FakeUsbSetting& setting) {
    return setting.alternate == 0 && setting.interfaceClass == 7 && setting.subClass == 1 &&
           setting.protocol != 4;
}

int attribute(const fs::path& device, const char* name) {
    int value = 0;
    std::ifstream(device / name) >> value;
    return value;
}

}  // namespace

VhciPort::VhciPort(FakePrinterModel model, int port)
    : printer_(std::move(model)), link_(kDevices + std::to_string(port)) {
    std::array<int, 2> ends{};
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0)
        throw std::system_error(errno, std::generic_category(), "socketpair");
    FileDescriptor own(ends[0]);
    const FileDescriptor kernels(ends[1]);
    if (!comesTrue([&] { return attach(kernels.get(), port); }, kLimit))
        throw std::runtime_error(std::string(kAttach) + " takes no device");
    peer_ = std::make_unique<UsbipPeer>(std::move(own), printer_);
    if (!comesTrue([this] { return isSetUp(); }, kLimit))
        throw std::runtime_error("the kernel has not set up " + link_.string());
}

VhciPort::~VhciPort() {
    peer_.reset();
    comesTrue([this] { return !isPresent(); }, kLimit);
}

bool VhciPort::isPresent() const {
    return fs::exists(fs::symlink_status(link_));
}

// The link to a driver is there before the driver has asked the printer for its device ID.
bool VhciPort::isSetUp() const {
    return std::ranges::all_of(printer_.model().settings, [this](const FakeUsbSetting& setting) {
        const auto path = interfacePath(setting.interface);
        return fs::exists(isForKernelDriver(setting) ? path / "ieee1284_id" : path);
    });
}

fs::path VhciPort::interfacePath(std::uint8_t interface) const {
    return link_ / (link_.filename().string() + ":" + std::to_string(printer_.model().configuration) + "." +
                    std::to_string(interface));
}

fs::path VhciPort::systemPath() const {
    return fs::canonical(link_);
}

fs::path VhciPort::nodePath() const {
    std::array<char, 32> path{};
    std::snprintf(path.data(), path.size(), "/dev/bus/usb/%03d/%03d", attribute(link_, "busnum"),
                  attribute(link_, "devnum"));
    return path.data();
}

std::string VhciPort::driver(std::uint8_t interface) const {
    std::error_code none;
    return fs::read_symlink(interfacePath(interface) / "driver", none).filename();
}

}  // namespace ventras
