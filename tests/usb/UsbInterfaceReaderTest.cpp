#include <gmock/gmock.h>

#include <optional>
#include <string>
#include <vector>

#include "tests/usb/UsbInterfaceReading.h"

namespace ventras {
namespace {

using namespace std::string_literals;
using testing::IsEmpty;
using testing::Optional;

// Identity ----------------------------------------------------------------------------------------

using UsbInterfaceIdentityReading = UsbInterfaceReading;

TEST_F(UsbInterfaceIdentityReading, TellsPlaceInterfaceVendorAndProduct) {
    attach({.vendor = 1008, .product = 17, .settings = {{.interface = 3}}});
    const auto identity = UsbInterfaceReader(registry).readIdentity(*service());
    EXPECT_THAT(identity.location, Optional(0x14100000U));
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

// IPP over USB ------------------------------------------------------------------------------------

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
