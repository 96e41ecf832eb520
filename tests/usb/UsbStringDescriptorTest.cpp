#include <gmock/gmock.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "tests/usb/UsbInterfaceReading.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;

// String descriptors ------------------------------------------------------------------------------

class UsbStringDescriptor : public UsbInterfaceReading {
protected:
    /// A printer whose string 2 is answered by `answer`.
    void attachAnswering(std::function<std::optional<UsbAnswer>(const UsbSetup&)> answer) {
        attach({.productName = "Laser"}).fault = [answer = std::move(answer)](const UsbSetup& setup) {
            return isGetString(setup, 2) ? answer(setup) : std::nullopt;
        };
    }

    std::vector<std::pair<std::uint16_t, std::chrono::milliseconds>> lengthsAndWaits() const {
        std::vector<std::pair<std::uint16_t, std::chrono::milliseconds>> list;
        for (const auto& request : registry.requests) {
            EXPECT_EQ(request.bmRequestType, 0x80);
            EXPECT_EQ(request.bRequest, 6);
            EXPECT_EQ(request.wValue, 0x0302);
            EXPECT_EQ(request.wIndex, 0x0409);
            list.emplace_back(request.wLength, request.noDataTimeOut);
        }
        return list;
    }
};

TEST_F(UsbStringDescriptor, IsReadByItsHeaderAndThenWhole) {
    attach({.productName = "Laser"});
    EXPECT_THAT(stringDescriptor(2), Optional("Laser"s));
    EXPECT_THAT(lengthsAndWaits(), ElementsAre(std::pair{2, 60ms}, std::pair{12, 60ms}));
}

TEST_F(UsbStringDescriptor, IsAskedForPatientlyWhenTheHeaderFails) {
    for (const auto& failure : {UsbAnswer::stall(), UsbAnswer::silence(), UsbAnswer{0, {12, 3}, 61ms}}) {
        registry = FakeUsbRegistry();
        attachAnswering([&](const UsbSetup& setup) {
            return setup.wLength == 2 ? std::optional{failure} : std::nullopt;
        });
        EXPECT_THAT(stringDescriptor(2), Optional("Laser"s));
        EXPECT_THAT(lengthsAndWaits(),
                    ElementsAre(std::pair{2, 60ms}, std::pair{256, 5000ms}, std::pair{12, 60ms}));
    }
}

TEST_F(UsbStringDescriptor, IsNotAskedForAgainAfterAnOverrunOfItsHeader) {
    attachAnswering([](const UsbSetup& setup) {
        return setup.wLength == 2 ? std::optional{UsbAnswer{EOVERFLOW, {12, 3}, {}}} : std::nullopt;
    });
    EXPECT_THAT(stringDescriptor(2), Optional("Laser"s));
    EXPECT_THAT(lengthsAndWaits(), ElementsAre(std::pair{2, 60ms}, std::pair{12, 60ms}));
}

TEST_F(UsbStringDescriptor, MayBeShorterThanThePatientRequest) {
    attachAnswering([](const UsbSetup& setup) -> std::optional<UsbAnswer> {
        if (setup.wLength == 2)
            return UsbAnswer::stall();
        if (setup.wLength == 256)
            return UsbAnswer{EREMOTEIO, {12, 3}, {}};
        return std::nullopt;
    });
    EXPECT_THAT(stringDescriptor(2), Optional("Laser"s));
}

TEST_F(UsbStringDescriptor, IsAbsentWhenThePatientRequestFailsToo) {
    for (const int error : {EPIPE, ETIMEDOUT, EOVERFLOW, ENODEV}) {
        registry = FakeUsbRegistry();
        attachAnswering([=](const UsbSetup&) { return UsbAnswer{error, {}, {}}; });
        EXPECT_EQ(stringDescriptor(2), error == EOVERFLOW ? std::optional{""s} : std::nullopt) << error;
    }
}

TEST_F(UsbStringDescriptor, OfLengthZeroIsEmpty) {
    attachAnswering([](const UsbSetup&) { return UsbAnswer{0, {0, 3}, {}}; });
    EXPECT_THAT(stringDescriptor(2), Optional(""s));
}

TEST_F(UsbStringDescriptor, OfAnotherTypeIsAbsent) {
    attachAnswering([](const UsbSetup&) { return UsbAnswer{0, {12, 2, 'L', 0}, {}}; });
    EXPECT_EQ(stringDescriptor(2), std::nullopt);
}

TEST_F(UsbStringDescriptor, ThatChangesItsTypeOrFailsAtLastIsAbsent) {
    for (const auto& last :
         {UsbAnswer{0, {12, 2, 'L', 0}, {}}, UsbAnswer::stall(), UsbAnswer::silence(), UsbAnswer{}}) {
        registry = FakeUsbRegistry();
        attachAnswering(
            [&](const UsbSetup& setup) { return setup.wLength == 2 ? std::nullopt : std::optional{last}; });
        EXPECT_EQ(stringDescriptor(2), std::nullopt) << last.error;
    }
}

struct OddString {
    UsbBytes reply;
    std::optional<std::string> expected;
};
const OddString kOddStrings[] = {
    {{1, 3}, std::nullopt},                         // too short for its own type
    {{2, 3}, ""},                                   //
    {{3, 3, 'A'}, ""},                              //
    {{5, 3, 'A', 0, 'B'}, "A"},                     // half a character
    {{6, 3, 'A', 0, 'B', 1}, "AB"},                 // the high bytes do not count
    {{6, 3, 0xC3, 0, 0xA9, 0}, "\xc3\xa9"},         // low bytes that make UTF-8
    {{4, 3, 0xE9, 0}, std::nullopt},                // and one that does not
    {{6, 3, 'A', 0, 0, 0}, std::string("A\0", 2)},  // padded with NUL
    {{200, 3, 'A', 0, 'B', 0}, "AB"},               // longer than what comes
    {{255, 3, 'A', 0, 'B', 0, 'C'}, "AB"},          //
};

TEST_F(UsbStringDescriptor, IsReadAsFarAsItGoes) {
    for (const auto& [reply, expected] : kOddStrings) {
        registry = FakeUsbRegistry();
        attachAnswering([&reply = reply](const UsbSetup& setup) {
            UsbAnswer answer{0, reply, {}};
            answer.data.resize(std::min<std::size_t>(reply.size(), setup.wLength));
            return answer;
        });
        EXPECT_EQ(stringDescriptor(2), expected) << "length " << int{reply[0]};
    }
}

}  // namespace
}  // namespace ventras
