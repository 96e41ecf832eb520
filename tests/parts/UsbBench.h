#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "tests/parts/FakePrinter.h"
#include "tests/parts/Program.h"
#include "tests/parts/UsbNode.h"

struct _UMockdevTestbed;

namespace ventras {

/// A USB of our own: FakePrinters behind libusb, udev and the kernel's device nodes, all emulated by
/// umockdev, for this process and the programs that it starts. Needs neither root nor USB hardware. One at a
/// time, one thread.
class UsbBench {
public:
    /// Starts the program again inside umockdev's preloaded library, unless it is there already. First thing
    /// in main() of a test that uses the bench with libraries of its own process.
    static void enter(char** arguments);

    UsbBench();
    UsbBench(const UsbBench&) = delete;
    UsbBench& operator=(const UsbBench&) = delete;
    ~UsbBench();

    /// What a program needs to see this bench when the test itself has not entered it.
    Environment environment() const;

    /// Plugs a printer in.
    /// @param place bus and ports as the kernel writes them: "1-4", "2-1.3.2"; hubs on the way are made
    FakePrinter& plugIn(const std::string& place, FakePrinterModel model = {});

    /// The kernel's side of a printer.
    UsbNode& node(const std::string& place);

    /// Takes a printer away.
    void unplug(const std::string& place);

    /// Path of the printer's device node, as programs see it.
    std::string nodePath(const std::string& place) const;

    /// Path of the node's file outside the bench, whose mode counts.
    std::string nodeFile(const std::string& place) const;

    /// Path of the printer in sysfs, as programs see it, e.g. "/sys/devices/...".
    std::string sysPath(const std::string& place) const;

private:
    struct Attached {
        std::string systemPath;
        std::string nodePath;
        std::vector<std::string> interfacePaths;
        std::unique_ptr<FakePrinter> printer;
        std::unique_ptr<UsbNode> node;
    };

    void announce(const std::string& systemPath, const char* action);
    void addHub(const std::string& place);
    std::string add(const std::string& place, const UsbBytes& descriptors, const std::string& more);
    std::vector<std::string> addInterfaces(const std::string& place, const FakePrinter& printer);

    _UMockdevTestbed* testbed_;
    std::map<std::string, Attached> printers_;
    std::set<std::string> hubs_;
    std::map<int, int> lastDeviceNumber_;  // by bus
    std::vector<Attached> unplugged_;      // programs may still have them open
};

}  // namespace ventras
