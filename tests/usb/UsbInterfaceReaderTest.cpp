#include "devices/UsbInterfaceReader.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <functional>
#include <string>

#include "tests/usb/FakeUsbRegistry.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::AnyOf;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;

constexpr std::uint32_t kPlace = 0x14100000;

/// One printer, and what a reader makes of its first interface.
class UsbInterfaceReading : public testing::Test {
protected:
    FakePrinter& attach(FakePrinterModel model) { return registry.attach(kPlace, std::move(model)); }

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

/// A complete ID of `length` bytes with its two length bytes.
std::string idOfLength(std::size_t length) {
    const std::string head = "MFG:Example;MDL:Laser;SN:A1;DES:";
    return head + std::string(length - 2 - head.size() - 1, 'x') + ";";
}

// Identity
// -------------------------------------------------------------------------------------------------------

using UsbInterfaceIdentityReading = UsbInterfaceReading;

TEST_F(UsbInterfaceIdentityReading, TellsPlaceInterfaceVendorAndProduct) {
    attach({.vendor = 1008, .product = 17, .settings = {{.interface = 3}}});
    const auto identity = UsbInterfaceReader(registry).readIdentity(*service());
    EXPECT_THAT(identity.location, Optional(kPlace));
    EXPECT_EQ(identity.interfaceNumber, 3);
    EXPECT_EQ(identity.vendorID, 1008);
    EXPECT_EQ(identity.productID, 17);
}

TEST_F(UsbInterfaceIdentityReading, IsAllZeroWhenTheInterfaceDoesNotOpen) {
    attach({.settings = {{.interface = 3}}});
    registry.failing = {"openInterface"};
    const auto identity = UsbInterfaceReader(registry).readIdentity(*service());
    EXPECT_EQ(identity.location, std::nullopt);
    EXPECT_EQ(identity.interfaceNumber, 0);
    EXPECT_EQ(identity.vendorID, 0);
    EXPECT_EQ(identity.productID, 0);
}

TEST_F(UsbInterfaceIdentityReading, LeavesZeroForTheOneValueThatCannotBeRead) {
    attach({.vendor = 1008, .product = 17});
    registry.failing = {"deviceVendor"};
    const auto identity = UsbInterfaceReader(registry).readIdentity(*service());
    EXPECT_EQ(identity.vendorID, 0);
    EXPECT_EQ(identity.productID, 17);
}

// Device ID: the request
// -------------------------------------------------------------------------------------------

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

// Device ID: lengths
// ---------------------------------------------------------------------------------------------

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

// Device ID: faults
// ----------------------------------------------------------------------------------------------

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

// Device ID: completion
// ------------------------------------------------------------------------------------------

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

// Device ID: "+" in serial numbers
// -------------------------------------------------------------------------------

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

// String descriptors
// ---------------------------------------------------------------------------------------------

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
        attachAnswering([&](const UsbSetup& setup) {
            UsbAnswer answer{0, reply, {}};
            answer.data.resize(std::min<std::size_t>(reply.size(), setup.wLength));
            return answer;
        });
        EXPECT_EQ(stringDescriptor(2), expected) << "length " << int{reply[0]};
    }
}

// IPP over USB
// ---------------------------------------------------------------------------------------------------

using IppOverUsbInterfaces = UsbInterfaceReading;

struct IppCase {
    std::vector<FakeUsbSetting> settings;
    std::optional<std::string> expected;
};
const IppCase kIppCases[] = {
    {{{0, 0, 7, 1, 2}}, std::nullopt},
    {{{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}, "07-01-02-01"},  // in another setting
    {{{0, 0, 7, 1, 2}, {1, 0, 7, 1, 4}}, "07-01-04-00"},  // in an interface of its own
    {{{0, 0, 7, 1, 2}, {1, 0, 7, 1, 4}, {2, 3, 7, 1, 4}, {2, 0, 7, 1, 4}},
     "07-01-04-00,07-01-04-03,07-01-04-00"},
    {{{0, 0, 7, 1, 2}, {1, 0, 0xFF, 1, 4}}, "FF-01-04"},                   // not of printer class: short
    {{{0, 0, 7, 1, 2}, {1, 0, 0xFF, 1, 4}, {1, 1, 7, 1, 4}}, "FF-01-04"},  // and its settings do not count
    {{{0, 0, 7, 1, 2}, {1, 0, 0xFF, 2, 4}}, std::nullopt},
    {{{0, 0, 7, 1, 2}, {1, 0, 0xFF, 2, 4}, {1, 10, 7, 1, 4}}, "FF-02-04-0A"},
    {{{0, 0, 7, 1, 2}, {1, 0, 7, 2, 4}}, std::nullopt},
};

TEST_F(IppOverUsbInterfaces, AreThoseWithProtocol4InAnySetting) {
    for (const auto& [settings, expected] : kIppCases) {
        registry = FakeUsbRegistry();
        attach({.settings = settings});
        EXPECT_EQ(ippOverUSB("MFG:A;"), expected);
    }
}

TEST_F(IppOverUsbInterfaces, AreNotLookedForWhenTheDeviceIDListsThem) {
    attach({});
    registry.failing = {"openInterface", "deviceOfInterface", "openDevice"};
    EXPECT_THAT(ippOverUSB("MFG:A;IPPE:anything;"), Optional("anything"s));
}

TEST_F(IppOverUsbInterfaces, AreLookedForWhenTheListInTheDeviceIDIsEmpty) {
    attach({.settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}});
    EXPECT_THAT(ippOverUSB("MFG:A;IPPE:;"), Optional("07-01-02-01"s));
    EXPECT_THAT(ippOverUSB(std::nullopt), Optional("07-01-02-01"s));
}

TEST_F(IppOverUsbInterfaces, AreUnknownWhenTheDeviceCannotBeReached) {
    for (const auto* operation : {"openInterface", "deviceOfInterface", "openDevice", "interfacesOfDevice"}) {
        registry = FakeUsbRegistry();
        attach({.settings = {{0, 0, 7, 1, 4}}});
        registry.failing = {operation};
        EXPECT_EQ(ippOverUSB("MFG:A;"), std::nullopt) << operation;
    }
}

TEST_F(IppOverUsbInterfaces, ReadAsZeroWhatTheInterfaceDoesNotTell) {
    attach({.settings = {{0, 0, 7, 1, 4}}});
    registry.failing = {"interfaceClass", "interfaceProtocol"};
    EXPECT_THAT(ippOverUSB("MFG:A;"), Optional("00-01-00-00"s));
}

}  // namespace
}  // namespace ventras
