#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>

#include "tests/kernel/UsbipPeer.h"
#include "tests/parts/FakePrinter.h"

namespace ventras {

/// A FakePrinter that is plugged into a port of the kernel's virtual USB host controller (vhci-hcd): its
/// descriptors, device nodes, drivers and transfers are the real kernel's. Needs root, and a kernel whose USB
/// nobody else uses. Its end is the printer's being unplugged. One thread at a time.
class VhciPort {
public:
    /// Plugs the printer in, and returns when the kernel has set it up, with its own driver.
    /// @param port of the controller's high-speed bus, 1 to 8
    /// @throw std::runtime_error when the kernel does not.
    explicit VhciPort(FakePrinterModel model = {}, int port = 1);
    VhciPort(const VhciPort&) = delete;
    VhciPort& operator=(const VhciPort&) = delete;
    ~VhciPort();

    FakePrinter& printer() { return printer_; }

    /// Where it is: in sysfs with its links resolved, and its device node.
    std::filesystem::path systemPath() const;
    std::filesystem::path nodePath() const;

    /// The driver that an interface has at present: "usblp", "usbfs" while a program has claimed it, or "".
    std::string driver(std::uint8_t interface) const;

    /// How many transfers were taken back before they were answered.
    int takenBack() const { return peer_->takenBack(); }

private:
    bool isPresent() const;
    bool isSetUp() const;
    std::filesystem::path interfacePath(std::uint8_t interface) const;

    FakePrinter printer_;
    std::filesystem::path link_;
    std::unique_ptr<UsbipPeer> peer_;
};

}  // namespace ventras
