#include <gmock/gmock.h>

#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>

#include "tests/usb/UsbInterfaceReading.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;

/// A complete ID of `length` bytes with its two length bytes.
std::string idOfLength(std::size_t length) {
    const std::string head = "MFG:Example;MDL:Laser;SN:A1;DES:";
    return head + std::string(length - 2 - head.size() - 1, 'x') + ";";
}

// Device ID: the request --------------------------------------------------------------------------

using UsbDeviceID = UsbInterfaceReading;

TEST_F(UsbDeviceID, IsAskedForWithConfigurationInterfaceAndSetting) {
    attach({.settings = {{.interface = 2}}, .configuration = 3});
    EXPECT_THAT(deviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
    ASSERT_THAT(registry.requests, SizeIs(1));
    const auto& request = registry.requests[0];
    EXPECT_EQ(request.bmRequestType, 0xA1);
    EXPECT_EQ(request.bRequest, 0);
    EXPECT_EQ(request.wValue, 2);
    EXPECT_EQ(request.wIndex, 0x0200);
    EXPECT_EQ(request.wLength, 256);
    EXPECT_EQ(request.noDataTimeOut, 5000ms);
    EXPECT_EQ(request.completionTimeOut, 0ms);
}

TEST_F(UsbDeviceID, NamesTheAlternateSettingInTheLowByte) {
    auto& printer = attach({.settings = {{.interface = 1}, {.interface = 1, .alternate = 5}}});
    printer.control({0x01, 11, 5, 1, 0});
    EXPECT_TRUE(deviceID());
    EXPECT_EQ(registry.requests.at(0).wIndex, 0x0105);
}

TEST_F(UsbDeviceID, IsNotAskedForWithoutTheNumbersThatTheRequestNeeds) {
    for (const auto* operation : {"configurationValue", "interfaceNumber", "alternateSetting"}) {
        registry = FakeUsbRegistry();
        attach({});
        registry.failing = {operation};
        EXPECT_EQ(deviceID(), std::nullopt) << operation;
        EXPECT_THAT(idRequestLengths(), IsEmpty()) << operation;
    }
}

TEST_F(UsbDeviceID, IsAbsentWhenTheInterfaceDoesNotOpen) {
    attach({});
    registry.failing = {"openInterface"};
    EXPECT_EQ(deviceID(), std::nullopt);
    EXPECT_THAT(registry.requests, IsEmpty());
}

// Device ID: lengths ------------------------------------------------------------------------------

TEST_F(UsbDeviceID, OfUpTo254BytesComesFromTheFirstRead) {
    for (const std::size_t length : {64U, 253U, 254U}) {
        registry = FakeUsbRegistry();
        attach({.deviceID = idOfLength(length)});
        EXPECT_THAT(deviceID(), Optional(idOfLength(length)));
        EXPECT_THAT(idRequestLengths(), ElementsAre(256)) << length;
    }
}

TEST_F(UsbDeviceID, OfMoreBytesIsReadAgainWithExactlyItsLength) {
    for (const std::size_t length : {255U, 256U, 257U, 1000U, 4096U, 65535U}) {
        registry = FakeUsbRegistry();
        attach({.deviceID = idOfLength(length)});
        EXPECT_THAT(deviceID(), Optional(idOfLength(length)));
        EXPECT_THAT(idRequestLengths(), ElementsAre(256, length));
    }
}

TEST_F(UsbDeviceID, OfThreeBytesIsOneCharacter) {
    attachAnswering([](const auto&, int) { return UsbAnswer::deviceID(3, "M;"); });
    EXPECT_THAT(deviceID(), Optional("M"s));
}

TEST_F(UsbDeviceID, WithALengthTooSmallToHoldAnythingIsAskedForOnceMoreAndAbsent) {
    for (const auto length : std::initializer_list<std::uint16_t>{0, 1, 2}) {
        registry = FakeUsbRegistry();
        attachAnswering([=](const auto&, int) { return UsbAnswer::deviceID(length, "MFG:Example;"); });
        EXPECT_EQ(deviceID(), std::nullopt) << length;
        EXPECT_THAT(idRequestLengths(), ElementsAre(256, length)) << length;
    }
}

TEST_F(UsbDeviceID, EndsWhereTheReplyEndsWhateverItsLengthSays) {
    for (const auto length : std::initializer_list<std::uint16_t>{100, 254, 255, 4000, 65535}) {
        registry = FakeUsbRegistry();
        attachAnswering([=](const auto&, int) { return UsbAnswer::deviceID(length, "MFG:A;MDL:B;SN:C;"); });
        EXPECT_THAT(deviceID(), Optional("MFG:A;MDL:B;SN:C;"s)) << length;
    }
}

TEST_F(UsbDeviceID, EndsWhereItsLengthEndsWhateverElseCame) {
    attachAnswering([](const auto&, int) { return UsbAnswer::deviceID(19, "MFG:A;MDL:B;SN:C;and more"); });
    EXPECT_THAT(deviceID(), Optional("MFG:A;MDL:B;SN:C;"s));
}

TEST_F(UsbDeviceID, WithSwappedLengthBytesIsReadAllTheSame) {
    const std::string id = "MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;";
    attachAnswering([&](const auto&, int) {
        return UsbAnswer::deviceID(static_cast<std::uint16_t>((id.size() + 2) << 8U), id);
    });
    EXPECT_THAT(deviceID(), Optional(id));
}

TEST_F(UsbDeviceID, OfTooFewBytesIsAbsent) {
    const UsbBytes longReply{0, 60, 'M', 'F', 'G'};
    for (const std::size_t bytes : {0U, 1U, 2U}) {
        registry = FakeUsbRegistry();
        attachAnswering([&](const auto&, int) {
            return UsbAnswer{
                0, UsbBytes(longReply.begin(), longReply.begin() + static_cast<std::ptrdiff_t>(bytes)), {}};
        });
        EXPECT_EQ(deviceID(), std::nullopt) << bytes;
    }
}

TEST_F(UsbDeviceID, IsAbsentWhenTheSecondReadGivesNothing) {
    for (const auto& second : {UsbAnswer{}, UsbAnswer::stall(), UsbAnswer::silence()}) {
        registry = FakeUsbRegistry();
        attachAnswering([&](const auto&, int count) {
            return count == 0 ? UsbAnswer::deviceID(300, std::string(254, 'x')) : second;
        });
        EXPECT_EQ(deviceID(), std::nullopt) << second.error;
        EXPECT_THAT(idRequestLengths(), ElementsAre(256, 300));
    }
}

// Device ID: faults -------------------------------------------------------------------------------

TEST_F(UsbDeviceID, IsAbsentAfterAnyFaultOfTheRequest) {
    for (const int error : {EPIPE, ETIMEDOUT, EOVERFLOW, ENODEV, EACCES, EPROTO}) {
        registry = FakeUsbRegistry();
        attachAnswering([=](const auto&, int) {
            auto answer = UsbAnswer::deviceID(14, "MFG:Example;");
            answer.error = error;
            return answer;
        });
        EXPECT_EQ(deviceID(), std::nullopt) << error;
    }
}

TEST_F(UsbDeviceID, ThatComesLateButInTimeIsTaken) {
    attachAnswering([](const auto&, int) {
        auto answer = UsbAnswer::deviceID(19, "MFG:A;MDL:B;SN:C;");
        answer.after = 4900ms;
        return answer;
    });
    EXPECT_THAT(deviceID(), Optional("MFG:A;MDL:B;SN:C;"s));
}

TEST_F(UsbDeviceID, ThatIsNoUtf8IsAbsent) {
    attachAnswering([](const auto&, int) { return UsbAnswer::deviceID(20, "MFG:\xff\xfe;MDL:B;SN:C;"); });
    EXPECT_EQ(deviceID(), std::nullopt);
}

TEST_F(UsbDeviceID, KeepsNulCharacters) {
    const std::string id("MFG:A\0;MDL:B;SN:C;\0\0", 20);
    attachAnswering([&](const auto&, int) { return UsbAnswer::deviceID(22, id); });
    EXPECT_THAT(deviceID(), Optional(id));
}

TEST_F(UsbDeviceID, NeedsNoFinalSemicolon) {
    attach({.deviceID = "MFG:A;MDL:B;SN:C"});
    EXPECT_THAT(deviceID(), Optional("MFG:A;MDL:B;SN:C"s));
}

// Device ID: completion ---------------------------------------------------------------------------

struct Completion {
    std::string deviceID, manufacturer, product, serial, expected;
};
const Completion kCompletions[] = {
    {"MFG:A;MDL:B;SN:C;", "M", "P", "S", "MFG:A;MDL:B;SN:C;"},          // nothing lacks
    {"MFG:A;MDL:B;", "M", "P", "S", "SERN:S;MFG:A;MDL:B;"},             //
    {"MFG:A;SN:C;", "M", "P", "S", "MDL:P;MFG:A;SN:C;"},                //
    {"MDL:B;SN:C;", "M", "P", "S", "MFG:M;MDL:B;SN:C;"},                //
    {"CMD:PCL;", "M", "P", "S", "MFG:M;MDL:P;SERN:S;CMD:PCL;"},         //
    {"", "M", "P", "S", "MFG:M;MDL:P;SERN:S;"},                         // an empty ID
    {"MFG:A;MDL:B;", "M", "P", "", "MFG:A;MDL:B;"},                     // iSerialNumber is 0
    {"MFG:;MDL:;SN:;", "M", "P", "S", "MFG:;MDL:;SN:;"},                // empty is not absent
    {"MFG:A;MDL:B;", "M", "P", "S+1", "SERN:S1;MFG:A;MDL:B;"},          // the clean-up reaches it
    {"product:(A B);", "M", "P", "S", "SERN:S;product:(A B);"},         // make and model out of the product
    {"MFG:A;MDL:B;", "M", "P", "S\xc3\xa9", "MFG:A;MDL:B;"},            // é as one byte is no UTF-8
    {"MFG:A;MDL:B;", "M", "P", "\xe4\xbd\x83", "SERN:C;MFG:A;MDL:B;"},  // U+4F43, its low byte is "C"
};

TEST_F(UsbDeviceID, IsCompletedFromTheStringDescriptors) {
    for (const auto& [id, manufacturer, product, serial, expected] : kCompletions) {
        registry = FakeUsbRegistry();
        attach(
            {.deviceID = id, .manufacturer = manufacturer, .productName = product, .serialNumber = serial});
        EXPECT_THAT(deviceID(), Optional(expected)) << id << " " << serial;
    }
}

TEST_F(UsbDeviceID, IsMadeUpFromTheDescriptorsAloneWhenThePrinterGivesNone) {
    auto& printer = attach({.manufacturer = "M", .productName = "P", .serialNumber = "S"});
    printer.fault = [](const UsbSetup& setup) {
        return isGetDeviceID(setup) ? std::optional{UsbAnswer::stall()} : std::nullopt;
    };
    EXPECT_THAT(deviceID(), Optional("MFG:M;MDL:P;SERN:S;"s));
}

TEST_F(UsbDeviceID, IsAbsentWhenNothingIsKnownAtAll) {
    attach({.deviceID = ""});
    EXPECT_EQ(deviceID(), std::nullopt);
}

TEST_F(UsbDeviceID, AsksForTheStringOfIndexZeroTooButForNoSerialNumber) {
    // Index 0 is the list of languages, here 0x0409 alone, whose low byte is a tab.
    attach({.deviceID = "CMD:PCL;", .productName = "P"});
    EXPECT_THAT(deviceID(), Optional("MFG:\t;MDL:P;CMD:PCL;"s));
}

TEST_F(UsbDeviceID, ReadsTheDeviceDescriptorOnlyWhereSomethingLacks) {
    attach({});
    EXPECT_TRUE(deviceID());
    EXPECT_THAT(registry.requests, SizeIs(1));
}

TEST_F(UsbDeviceID, AsksForTheDeviceDescriptorBriefly) {
    attach({.deviceID = "MFG:A;MDL:B;"});
    EXPECT_TRUE(deviceID());
    const auto& request = registry.requests.at(1);
    EXPECT_EQ(request.bmRequestType, 0x80);
    EXPECT_EQ(request.bRequest, 6);
    EXPECT_EQ(request.wValue, 0x0100);
    EXPECT_EQ(request.wIndex, 0);
    EXPECT_EQ(request.wLength, 18);
    EXPECT_EQ(request.noDataTimeOut, 60ms);
}

TEST_F(UsbDeviceID, StaysAsItIsWhenTheDeviceDescriptorIsNotToBeHad) {
    const UsbAnswer answers[] = {UsbAnswer::stall(), UsbAnswer::silence(), UsbAnswer{0, {18, 1}, {}},
                                 UsbAnswer{}};
    for (const auto& answer : answers) {
        registry = FakeUsbRegistry();
        auto& printer = attach({.deviceID = "MFG:A;MDL:B;", .serialNumber = "S"});
        printer.fault = [&](const UsbSetup& setup) {
            return isGetDeviceDescriptor(setup) ? std::optional{answer} : std::nullopt;
        };
        EXPECT_THAT(deviceID(), Optional("MFG:A;MDL:B;"s)) << answer.error;
        EXPECT_THAT(registry.requests, SizeIs(2)) << "no string may be asked for";
    }
}

// Device ID: "+" in serial numbers ----------------------------------------------------------------

struct Plus {
    std::string deviceID, expected;
};
const Plus kPluses[] = {
    {"MFG:A+;MDL:B+C;SN:AB+12;", "MFG:A+;MDL:B+C;SN:AB12;"},
    {"MFG:A;MDL:B;SN:+A+B+;", "MFG:A;MDL:B;SN:AB;"},
    {"MFG:A;MDL:B;SN:AB 12;DES:x+y;", "MFG:A;MDL:B;SN:AB 12;DES:x+y;"},
    {"MFG:A;MDL:X+1;SN:X+1;", "MFG:A;MDL:X1;SN:X+1;"},  // only the first place where that text stands
    {"MFG:A;MDL:B;SN:+;", "MFG:A;MDL:B;SN:;"},
};

TEST_F(UsbDeviceID, LosesThePlusesOfItsSerialNumberOnly) {
    for (const auto& [id, expected] : kPluses) {
        registry = FakeUsbRegistry();
        attach({.deviceID = id});
        EXPECT_THAT(deviceID(), Optional(expected)) << id;
    }
}

}  // namespace
}  // namespace ventras
