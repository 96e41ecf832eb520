#include "devices/ScannerObject.h"

#include <gtest/gtest.h>

#include <limits>
#include <ostream>
#include <string>
#include <string_view>

#include "devices/USBPrinterObject.h"
#include "devices/UsbEnumeration.h"
#include "drivers/PPDManager.h"
#include "platform/FileContent.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/TemporaryFile.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/usb/FakeUsbRegistry.h"

namespace ventras {
namespace {

using Text = std::optional<std::string>;

constexpr std::uint32_t kLocation = 336592896;

class Scanner : public testing::Test {
protected:
    std::shared_ptr<ScannerObject> scanner(std::string_view description) {
        UsbEnumeration usb(fake_.platform, drivers_, registry_);
        return ScannerObject::scannerObjectWithString(description, usb, fake_.computerName);
    }

    // The text of a scanner's PPD, whose file is gone afterwards.
    static Text ppdOf(const ScannerObject& scanner) {
        auto path = scanner.ppdFile();
        if (!path)
            return std::nullopt;
        const auto file = TemporaryFile::adopt(*path);
        return fileContent(file.path());
    }

    FakeUsbRegistry registry_;
    FakePlatform fake_;
    PPDManager drivers_{fake_.platform};
};

TEST_F(Scanner, OnTheUsbIsReadFromEightFields) {
    const auto found = scanner("U,P,Name,/icon,USB,336592896,17,1008");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->uuidString(), "U");
    EXPECT_EQ(found->persistentID(), "P");
    EXPECT_EQ(found->name(), "Name");
    EXPECT_EQ(found->iconPath(), "/icon");
    EXPECT_EQ(found->transportType(), ImageDeviceTransport::kUSB);
    EXPECT_EQ(found->type(), 256U);
    EXPECT_EQ(found->usbLocationID(), kLocation);
    EXPECT_EQ(found->usbProductID(), 17U);
    EXPECT_EQ(found->usbVendorID(), 1008U);
    EXPECT_EQ(found->modulePath(), std::nullopt);
    EXPECT_FALSE(found->isMFP());
}

TEST_F(Scanner, OnTheUsbHasItsModuleInTheNinthField) {
    EXPECT_EQ(scanner("U,P,Name,/icon,USB,336592896,17,1008,/lib/module")->modulePath(), "/lib/module");
}

TEST_F(Scanner, OnFireWireIsReadFromSixOrSevenFields) {
    const auto found = scanner("U,P,Name,/icon,FireWire,-9223372036854775808");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->transportType(), ImageDeviceTransport::kFireWire);
    EXPECT_EQ(found->fwGUID(), std::numeric_limits<std::int64_t>::min());
    EXPECT_EQ(found->type(), 256U);
    EXPECT_EQ(found->modulePath(), std::nullopt);
    EXPECT_EQ(scanner("U,P,Name,/icon,FireWire,1,/lib/module")->modulePath(), "/lib/module");
}

TEST_F(Scanner, HasItsTransportInAnyCase) {
    for (const auto* transport : {"usb", "Usb", "uSB"})
        EXPECT_TRUE(scanner(std::string("U,P,N,/i,") + transport + ",1,2,3")) << transport;
    for (const auto* transport : {"firewire", "FIREWIRE"})
        EXPECT_TRUE(scanner(std::string("U,P,N,/i,") + transport + ",1")) << transport;
}

struct FieldCount {
    std::string_view transport;
    std::size_t fewest, most;
};

void PrintTo(const FieldCount& count, std::ostream* out) {
    *out << count.transport;
}

class ScannerFields : public Scanner, public testing::WithParamInterface<FieldCount> {};

TEST_P(ScannerFields, AreCountedExactly) {
    const auto& [transport, fewest, most] = GetParam();
    for (std::size_t count = 0; count <= 12; ++count) {
        std::string description;
        for (std::size_t field = 0; field < count; ++field)
            description += (field == 0 ? "" : ",") + (field == 4 ? std::string(transport) : "1");
        const bool isAScanner = count >= fewest && count <= most;
        EXPECT_EQ(scanner(description) != nullptr, isAScanner) << description;
    }
}

INSTANTIATE_TEST_SUITE_P(Transports, ScannerFields,
                         testing::Values(FieldCount{"USB", 8, 9}, FieldCount{"FireWire", 6, 7},
                                         FieldCount{"TCP/IP", 1, 0}, FieldCount{"Bluetooth", 1, 0},
                                         FieldCount{"", 1, 0}));

struct NumberCase {
    std::string_view text;
    std::uint32_t location;
};

TEST_F(Scanner, ReadsItsNumbersAsSignedDecimalsThatClamp) {
    constexpr NumberCase kNumbers[] = {
        {"0", 0},
        {"-1", 0xFFFFFFFF},
        {"2147483647", 0x7FFFFFFF},
        {"2147483648", 0x7FFFFFFF},
        {"99999999999999999999999", 0x7FFFFFFF},
        {"-99999999999999999999999", 0x80000000},
        {"12abc", 12},
        {" 7", 7},
        {"+7", 7},
        {"abc", 0},
        {"", 0},
        {"0x10", 0},
    };
    for (const auto& [text, location] : kNumbers)
        EXPECT_EQ(scanner("U,P,N,/i,USB," + std::string(text) + ",0,0")->usbLocationID(), location) << text;
}

TEST_F(Scanner, KnowsThePrinterHalfOfItsDevice) {
    registry_.attach(kLocation, {.vendor = 1008, .product = 17});
    const auto found = scanner("U,P,Name,/icon,USB,336592896,17,1008");
    ASSERT_TRUE(found->isMFP());
    EXPECT_EQ(found->printer()->location(), kLocation);
}

TEST_F(Scanner, IsNoHalfOfAnotherPrinter) {
    registry_.attach(kLocation, {.vendor = 1008, .product = 18});
    registry_.attach(kLocation + 1, {.vendor = 1008, .product = 17});
    EXPECT_FALSE(scanner("U,P,Name,/icon,USB,336592896,17,1008")->isMFP());
}

TEST_F(Scanner, TakesTheFirstOfTwoPrintersInOnePlace) {
    registry_.attach(kLocation, {.vendor = 1008, .product = 17, .deviceID = "MFG:A;MDL:1;SN:1;"});
    registry_.attach(kLocation, {.vendor = 1008, .product = 17, .deviceID = "MFG:A;MDL:2;SN:2;"});
    EXPECT_EQ(scanner("U,P,Name,/icon,USB,336592896,17,1008")->printer()->model(), "1");
}

TEST_F(Scanner, DescribesItselfWithVendorAndProductCrossed) {
    EXPECT_EQ(scanner("U,P,N,/i,USB,336592896,17,1008")->description(),
              "usb:[loc:336592896 vend:17 prod:1008] [U]");
    EXPECT_EQ(scanner("U,P,N,/i,FireWire,-5")->description(), "firewire:-5 [U]");
    EXPECT_EQ(ScannerObject(fake_.computerName, "U", "P", std::string("Service")).description(),
              "Corvid:Service [U]");
}

TEST_F(Scanner, IsAddressedByItsUUID) {
    EXPECT_EQ(scanner("U,P,N,/i,USB,1,2,3")->deviceURI(), "usb://U");
    EXPECT_EQ(scanner("U,P,N,/i,FireWire,1")->deviceURI(), "usb://U");
    EXPECT_EQ(ScannerObject(fake_.computerName, "U", "P", std::string("Service")).deviceURI(), "mdns://U");
}

TEST_F(Scanner, IsLocatedAtTheComputerItHangsOn) {
    EXPECT_EQ(scanner("U,P,N,/i,USB,1,2,3")->deviceLocation(), "Reading Room");
    EXPECT_EQ(scanner("U,P,N,/i,FireWire,1")->deviceLocation(), "Reading Room");
    EXPECT_EQ(ScannerObject(fake_.computerName, "U", "P", std::string("Service")).deviceLocation(), "");
    fake_.computerName.value = std::nullopt;
    EXPECT_EQ(scanner("U,P,N,/i,USB,1,2,3")->deviceLocation(), std::nullopt);
}

TEST_F(Scanner, OnTheNetworkHasTheNetworksType) {
    const ScannerObject network(fake_.computerName, "U", "P", std::string("Service"));
    EXPECT_EQ(network.type(), 1024U);
    EXPECT_EQ(network.corvidServiceName(), "Service");
    EXPECT_EQ(network.transportType(), ImageDeviceTransport::kTCPIP);
}

constexpr std::string_view kHead =
    "*PPD-Adobe: \"4.3\"\n"
    "*FormatVersion: \"4.3\"\n"
    "*LanguageEncoding: ISOLatin1\n"
    "*LanguageVersion: English\n"
    "*FileVersion: \"1.0\"\n"
    "*PCFileName: \"Scanner.ppd\"\n"
    "*Manufacturer: \"Scanner Printer Manufacturer\"\n"
    "*Product: \"(Scanner)\"\n";

TEST_F(Scanner, WritesItsPPDByteForByte) {
    EXPECT_EQ(ppdOf(*scanner("U,P,Name,/icon,USB,1,2,3,/lib/module")),
              std::string(kHead) +
                  "*ModelName: \"Name\"\n"
                  "*ShortNickName: \"Name\"\n"
                  "*NickName: \"Name\"\n"
                  "*QLScannerOnly: True\n"
                  "*QLScannerUUID: \"U\"\n"
                  "*QLPersistentIDString: \"P\"\n"
                  "*QLScannerModulePath: \"/lib/module\"\n"
                  "*QLICADriver: True\n"
                  "*QLPrinterIconPath: \"/icon\"\n"
                  "*cupsLanguages: \"en\"\n");
}

TEST_F(Scanner, LeavesOutOfItsPPDWhatItDoesNotHave) {
    const ScannerObject bare(fake_.computerName, "U", "P", 1, 2, 3);
    EXPECT_EQ(ppdOf(bare), std::string(kHead) +
                               "*ModelName: \"Scanner\"\n"
                               "*ShortNickName: \"Scanner\"\n"
                               "*NickName: \"Scanner\"\n"
                               "*QLScannerOnly: True\n"
                               "*QLScannerUUID: \"U\"\n"
                               "*QLPersistentIDString: \"P\"\n"
                               "*QLICADriver: True\n"
                               "*cupsLanguages: \"en\"\n");
}

TEST_F(Scanner, MarksTheQueueAsSharedOnlyByThatBit) {
    ScannerObject found(fake_.computerName, "U", "P", 1, 2, 3);
    for (const std::uint64_t type : {0x0U, 0x100U, 0x400U, 0x500U}) {
        found.setType(type);
        EXPECT_EQ(ppdOf(found)->find("QLRemoteQueueID"), std::string::npos) << type;
    }
    for (const std::uint64_t type : {0x200U, 0x300U, 0x600U}) {
        found.setType(type);
        EXPECT_TRUE(ppdOf(found)->ends_with("*cupsLanguages: \"en\"\n*QLRemoteQueueID: shared\n")) << type;
    }
}

TEST_F(Scanner, WritesHostileNamesAsTheyStand) {
    const std::string longName(5000, 'n');
    for (const auto& name :
         {std::string("say \"cheese\""), std::string("two\nlines"), longName, std::string()}) {
        ScannerObject found(fake_.computerName, "U", "P", 1, 2, 3);
        found.setName(name);
        EXPECT_NE(ppdOf(found)->find("*NickName: \"" + name + "\"\n"), std::string::npos) << name;
    }
}

TEST_F(Scanner, HasNoDriversAndServesNoPrinterQueue) {
    const auto found = scanner("U,P,N,/i,USB,1,2,3");
    EXPECT_EQ(found->driverList(), std::nullopt);
    EXPECT_EQ(found->matchExistingQueues({{"q", "usb://U", 4}}), std::nullopt);
    EXPECT_EQ(found->softwareUpdateScanDeviceID(), std::nullopt);
    EXPECT_FALSE(found->supportsPCL());
    EXPECT_FALSE(found->supportsPostscript());
}

}  // namespace
}  // namespace ventras
