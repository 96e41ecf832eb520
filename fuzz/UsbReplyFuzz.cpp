#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <span>

#include "devices/UsbInterfaceReader.h"
#include "fuzz/Require.h"
#include "tests/usb/FakeUsbRegistry.h"

// A USB device that says anything at all: which interfaces it has, and how it answers each control request,
// is in the input. One byte of it is an answer's error, two are its length, its data follow; when the input
// is at its end, nothing answers any more.

namespace {

using namespace ventras;

class Input {
public:
    explicit Input(std::span<const std::uint8_t> bytes) : rest_(bytes) {}

    std::uint8_t byte() {
        const auto bytes = take(1);
        return bytes.empty() ? std::uint8_t{0} : bytes[0];
    }

    UsbBytes bytes(std::size_t count) {
        const auto taken = take(count);
        return {taken.begin(), taken.end()};
    }

    bool isAtEnd() const { return rest_.empty(); }

private:
    std::span<const std::uint8_t> take(std::size_t count) {
        const auto taken = rest_.first(std::min(count, rest_.size()));
        rest_ = rest_.subspan(taken.size());
        return taken;
    }

    std::span<const std::uint8_t> rest_;
};

FakePrinterModel modelFrom(Input& input) {
    FakePrinterModel model;
    for (int more = input.byte() % 4; more > 0; --more) {
        const auto place = input.byte();
        model.settings.push_back({static_cast<std::uint8_t>(place & 3U),
                                  static_cast<std::uint8_t>(place >> 2U & 3U), input.byte(), input.byte(),
                                  input.byte()});
    }
    return model;
}

UsbAnswer answerFrom(Input& input) {
    constexpr std::array kErrors{0, 0, 0, 0, EPIPE, EOVERFLOW, EREMOTEIO, ENODEV};
    if (input.isAtEnd())
        return UsbAnswer::silence();
    const int error = kErrors[input.byte() % kErrors.size()];
    const std::size_t length = input.byte() | static_cast<std::size_t>(input.byte()) << 8U;
    return {error, input.bytes(length), {}};
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input({data, size});
    FakeUsbRegistry registry;
    registry.attach(0x01100000, modelFrom(input)).fault = [&](const UsbSetup&) {
        return std::optional{answerFrom(input)};
    };
    {
        const auto interfaces = registry.matchingInterfaces(kUsbPrinterInterfaces);
        UsbInterfaceReader reader(registry);
        while (const auto service = registry.nextInterface(*interfaces)) {
            const auto deviceID = reader.readDeviceID(*service);
            require(!deviceID || !deviceID->empty());
            const auto list = reader.listIPPOverUSBInterfaces(*service, deviceID);
            require(!list || !list->empty());
            const auto interface = registry.openInterface(*service);
            const auto text = reader.readStringDescriptor(*interface, input.byte());
            require(!text || text->size() <= 127);
        }
    }
    // Two ID requests, a device descriptor, three strings of three requests, and three more for the last
    // string.
    require(registry.requests.size() <= 4U * 15U);
    require(registry.livingReferences == 0);
    return 0;
}
