#include "devices/UsbEnumeration.h"

#include <gmock/gmock.h>

#include <string>

#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/usb/FakeUsbRegistry.h"

namespace ventras {
namespace {

using namespace std::string_literals;
using testing::IsEmpty;
using testing::IsNull;
using testing::Optional;
using testing::SizeIs;

constexpr std::uint32_t kPlace = 336592896;  // 0x14100000

class UsbPrinters : public testing::Test {
protected:
    std::vector<UsbEnumeration::PrinterPtr> printersAt(const UsbEnumeration::LocationFilter& filter) {
        return UsbEnumeration(fakes.platform, drivers, registry).printerObjects(filter);
    }

    UsbEnumeration::PrinterPtr printerOfScanner(std::uint32_t location, std::uint32_t vendor,
                                                std::uint32_t product) {
        return UsbEnumeration(fakes.platform, drivers, registry)
            .printerObjectForScanner(location, vendor, product);
    }

    void TearDown() override { EXPECT_EQ(registry.livingReferences, 0) << "something was not released"; }

    FakePlatform fakes;
    PPDManager drivers{fakes.platform};
    FakeUsbRegistry registry;
};

TEST_F(UsbPrinters, AreFoundByLocationAndInterfaceInDecimal) {
    registry.attach(kPlace, {.vendor = 1008, .product = 17, .settings = {{.interface = 2}}});
    const auto printers = printersAt({"336592896,2"});
    ASSERT_THAT(printers, SizeIs(1));
    EXPECT_EQ(printers[0]->location(), kPlace);
    EXPECT_EQ(printers[0]->interfaceNumber(), 2);
    EXPECT_EQ(printers[0]->vendorID(), 1008);
    EXPECT_EQ(printers[0]->productID(), 17);
    EXPECT_THAT(printers[0]->deviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
}

TEST_F(UsbPrinters, AreNotFoundByAnyOtherSpelling) {
    registry.attach(kPlace);
    for (const auto* filter : {"336592896,1", "336592897,0", "0x14100000,0", "336592896", "336592896, 0",
                               "336592896,00", " 336592896,0", "336592896,0 ", ""})
        EXPECT_THAT(printersAt({filter}), IsEmpty()) << filter;
    EXPECT_THAT(printersAt({}), IsEmpty());
}

TEST_F(UsbPrinters, ThatNobodyAskedForAreLeftAlone) {
    registry.attach(kPlace);
    EXPECT_THAT(printersAt({"1,0"}), IsEmpty());
    EXPECT_THAT(registry.requests, IsEmpty());
}

TEST_F(UsbPrinters, OfSeveralLocationsAreAllFound) {
    registry.attach(0x01100000);
    registry.attach(0x02132000, {.settings = {{.interface = 0}, {.interface = 1}}});
    registry.attach(0x03000000);
    EXPECT_THAT(printersAt({"17825792,0", "34807808,1", "34807808,0"}), SizeIs(3));
}

TEST_F(UsbPrinters, WhoseLocationCannotBeReadAreSkipped) {
    registry.attach(kPlace);
    registry.failing = {"interfaceLocation"};
    EXPECT_THAT(printersAt({"336592896,0", "0,0", "4294967295,0"}), IsEmpty());
}

TEST_F(UsbPrinters, AtLocationZeroAreKept) {
    registry.attach(0);
    EXPECT_THAT(printersAt({"0,0"}), SizeIs(1));
}

TEST_F(UsbPrinters, AtNoLocationAreSkipped) {
    registry.attach(0xFFFFFFFF);
    EXPECT_THAT(printersAt({"4294967295,0"}), IsEmpty());
}

TEST_F(UsbPrinters, WithoutADeviceIDAreSkipped) {
    registry.attach(kPlace).fault = [](const UsbSetup&) { return UsbAnswer::stall(); };
    EXPECT_THAT(printersAt({"336592896,0"}), IsEmpty());
}

TEST_F(UsbPrinters, ThatOfferIPPOverUSBAreLeftToTheirOwnKind) {
    const std::vector<std::vector<FakeUsbSetting>> kinds{
        {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}},
        {{0, 0, 7, 1, 2}, {1, 0, 7, 1, 4}},
        {{0, 0, 7, 1, 2}, {1, 0, 0xFF, 1, 4}},
    };
    for (const auto& settings : kinds) {
        registry = FakeUsbRegistry();
        registry.attach(kPlace, {.settings = settings});
        EXPECT_THAT(printersAt({"336592896,0", "336592896,1"}), IsEmpty());
    }
}

TEST_F(UsbPrinters, WhoseDeviceIDListsIPPOverUSBAreLeftToTheirOwnKind) {
    registry.attach(kPlace, {.deviceID = "MFG:A;MDL:B;SN:C;IPPE:07-01-04-00;"});
    EXPECT_THAT(printersAt({"336592896,0"}), IsEmpty());
}

TEST_F(UsbPrinters, BesideAnIPPOverUSBPrinterAreFound) {
    registry.attach(0x01100000, {.settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}});
    registry.attach(0x01200000);
    const auto printers = printersAt({"17825792,0", "18874368,0"});
    ASSERT_THAT(printers, SizeIs(1));
    EXPECT_EQ(printers[0]->location(), 0x01200000U);
}

TEST_F(UsbPrinters, ThatCannotBeListedAreNone) {
    registry.attach(kPlace);
    registry.failing = {"matchingInterfaces"};
    EXPECT_THAT(printersAt({"336592896,0"}), IsEmpty());
    EXPECT_THAT(printerOfScanner(kPlace, 0x0912, 1), IsNull());
}

using PrinterOfAScanner = UsbPrinters;

TEST_F(PrinterOfAScanner, SitsInTheSameDevice) {
    registry.attach(0x01100000, {.vendor = 1008, .product = 17});
    registry.attach(kPlace, {.vendor = 1008, .product = 17, .settings = {{.interface = 3}}});
    const auto printer = printerOfScanner(kPlace, 1008, 17);
    ASSERT_TRUE(printer);
    EXPECT_EQ(printer->location(), kPlace);
    EXPECT_EQ(printer->interfaceNumber(), 0);
    EXPECT_EQ(printer->vendorID(), 1008);
    EXPECT_EQ(printer->productID(), 17);
    EXPECT_THAT(printer->deviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
}

TEST_F(PrinterOfAScanner, HasToAgreeInLocationVendorAndProduct) {
    registry.attach(kPlace, {.vendor = 1008, .product = 17});
    EXPECT_THAT(printerOfScanner(kPlace + 1, 1008, 17), IsNull());
    EXPECT_THAT(printerOfScanner(kPlace, 1009, 17), IsNull());
    EXPECT_THAT(printerOfScanner(kPlace, 1008, 18), IsNull());
    EXPECT_THAT(printerOfScanner(kPlace, 0x10000 + 1008, 17), IsNull());
    EXPECT_THAT(printerOfScanner(kPlace, 1008, 0x10000 + 17), IsNull());
    EXPECT_THAT(registry.requests, IsEmpty());
}

TEST_F(PrinterOfAScanner, MaySpeakIPP) {
    registry.attach(kPlace, {.vendor = 1008, .product = 17, .settings = {{0, 0, 7, 1, 4}}});
    EXPECT_TRUE(printerOfScanner(kPlace, 1008, 17));
}

TEST_F(PrinterOfAScanner, IsTheFirstInterfaceThatTellsWhatItIs) {
    auto& printer = registry.attach(
        kPlace, {.vendor = 1, .product = 2, .settings = {{.interface = 0}, {.interface = 1}}});
    printer.fault = [](const UsbSetup& setup) {
        return isGetDeviceID(setup) && setup.wIndex == 0x0100 ? std::nullopt
                                                              : std::optional{UsbAnswer::stall()};
    };
    const auto found = printerOfScanner(kPlace, 1, 2);
    ASSERT_TRUE(found);
    EXPECT_EQ(found->interfaceNumber(), 0);
}

TEST_F(PrinterOfAScanner, IsAbsentWithoutADeviceID) {
    registry.attach(kPlace, {.vendor = 1, .product = 2}).fault = [](const UsbSetup&) {
        return UsbAnswer::stall();
    };
    EXPECT_THAT(printerOfScanner(kPlace, 1, 2), IsNull());
}

}  // namespace
}  // namespace ventras
