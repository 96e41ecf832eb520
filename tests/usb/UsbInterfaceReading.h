#pragma once

#include <gmock/gmock.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "devices/UsbInterfaceReader.h"
#include "tests/usb/FakeUsbRegistry.h"

namespace ventras {

/// One printer, and what a reader makes of its first interface.
class UsbInterfaceReading : public testing::Test {
protected:
    FakePrinter& attach(FakePrinterModel model) { return registry.attach(0x14100000, std::move(model)); }

    /// A printer whose GET_DEVICE_ID is answered by `answer`, the n-th time (from 0).
    FakePrinter& attachAnswering(std::function<UsbAnswer(const UsbSetup&, int)> answer) {
        auto& printer = attach({});
        printer.fault = [answer = std::move(answer), count = 0](const UsbSetup& setup) mutable {
            return isGetDeviceID(setup) ? std::optional{answer(setup, count++)} : std::nullopt;
        };
        return printer;
    }

    std::unique_ptr<UsbInterfaceService> service() {
        const auto interfaces = registry.matchingInterfaces(kUsbPrinterInterfaces);
        return registry.nextInterface(*interfaces);
    }

    std::optional<std::string> deviceID() { return UsbInterfaceReader(registry).readDeviceID(*service()); }

    std::optional<std::string> stringDescriptor(std::uint8_t index) {
        const auto interface = registry.openInterface(*service());
        return UsbInterfaceReader(registry).readStringDescriptor(*interface, index);
    }

    std::optional<std::string> ippOverUSB(const std::optional<std::string>& id) {
        return UsbInterfaceReader(registry).listIPPOverUSBInterfaces(*service(), id);
    }

    /// The lengths that GET_DEVICE_ID was asked with.
    std::vector<std::uint16_t> idRequestLengths() const {
        std::vector<std::uint16_t> lengths;
        for (const auto& request : registry.requests)
            if (request.bmRequestType == 0xA1 && request.bRequest == 0)
                lengths.push_back(request.wLength);
        return lengths;
    }

    void TearDown() override { EXPECT_EQ(registry.livingReferences, 0) << "something was not released"; }

    FakeUsbRegistry registry;
};

}  // namespace ventras
