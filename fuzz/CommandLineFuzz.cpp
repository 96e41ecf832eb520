#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "agent/CommandLine.h"
#include "agent/Request.h"
#include "drivers/PPDManager.h"
#include "fuzz/Require.h"
#include "platform/Utf8.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/usb/FakeUsbRegistry.h"

// The agent's command line is put together by whatever noticed a device, with names in it that the device
// chose. Arguments are lines of the input. No device may come of an argument that is none, and nothing is
// asked on a network before a device is looked at.

namespace {

using namespace ventras;

constexpr std::uint32_t kPlace = 20971520;

// Without those that are answered on standard error, where libFuzzer writes.
std::vector<std::string> argumentsIn(std::string_view text) {
    std::vector<std::string> arguments;
    while (!text.empty()) {
        const auto line = text.substr(0, text.find('\n'));
        if (isValidUtf8(line) && parseArgument(line).kind != ArgumentKind::Deprecated)
            arguments.emplace_back(line);
        text.remove_prefix(std::min(line.size() + 1, text.size()));
    }
    return arguments;
}

bool mayBeDevice(const std::string& argument) {
    switch (parseArgument(argument).kind) {
        case ArgumentKind::UsbLocation:
        case ArgumentKind::Scanner:
        case ArgumentKind::IppUsb:
        case ArgumentKind::NetworkURI:
            return true;
        default:
            return false;
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    FakeUsbRegistry usb;
    usb.attach(kPlace);
    FakePlatform fake(&usb);
    PPDManager drivers(fake.platform);
    const auto arguments = argumentsIn({reinterpret_cast<const char*>(data), size});
    for (const auto& argument : arguments)
        require(argument.ends_with(parseArgument(argument).text));

    const auto request = requestFromArguments(arguments, fake.platform, drivers);
    const auto most = std::ranges::count_if(arguments, mayBeDevice);
    require(request.devices.size() <= static_cast<std::size_t>(most));
    for (const auto& device : request.devices)
        require(device != nullptr && !device->queueID());
    return 0;
}
