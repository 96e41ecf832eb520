// Starts the agent for the printers of one USB device: what the systemd unit for a device that was plugged in
// runs. ventrasagent-hotplug SYSFS-PATH PROGRAM [ARGUMENT...] becomes PROGRAM ARGUMENT...
// -uLOCATION,INTERFACE...

#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "platform/linux/ArgumentPointers.h"
#include "platform/linux/usb/LibusbDevice.h"

namespace {

using namespace ventras;

// As shells have it: none of the agent's own.
constexpr int kCannotRun = 127;

/// A number that the kernel tells of a device; -1 when it does not.
int attribute(const std::string& systemPath, const char* name) {
    int value = -1;
    std::ifstream file(systemPath + "/" + name);
    return file >> value ? value : -1;
}

std::vector<std::string> agentArguments(const std::vector<LibusbDevicePtr>& devices, int bus, int number) {
    std::vector<std::string> arguments;
    for (const auto& device : devices)
        if (libusb_get_bus_number(device->device.get()) == bus &&
            libusb_get_device_address(device->device.get()) == number)
            for (const auto& interface : device->interfaces)
                if (interface.hasSetting(kUsbPrinterInterfaces))
                    arguments.push_back("-u" + std::to_string(device->location) + "," +
                                        std::to_string(interface.number));
    return arguments;
}

}  // namespace

int main(int argc, char* argv[]) {
    if (argc < 3) {
        std::fprintf(stderr, "Usage: %s SYSFS-PATH PROGRAM [ARGUMENT...]\n", argv[0]);
        return 2;
    }
    std::vector<std::string> command(argv + 2, argv + argc);
    {
        LibusbContext context;
        const auto devices = context.devices().value_or(std::vector<LibusbDevicePtr>{});
        const auto more = agentArguments(devices, attribute(argv[1], "busnum"), attribute(argv[1], "devnum"));
        if (more.empty())
            return 0;  // no printer, or gone already
        command.insert(command.end(), more.begin(), more.end());
    }
    const auto pointers = argumentPointers(command);
    execv(pointers[0], pointers.data());
    std::perror(pointers[0]);
    return kCannotRun;
}
