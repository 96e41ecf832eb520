#include <gtest/gtest.h>

#include <random>

#include "backend/usb/StockDeviceURI.h"
#include "backend/usb/StockListing.h"
#include "devices/USBPrinterObject.h"
#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/Program.h"
#include "tests/parts/StockUsbBackend.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

constexpr const char* kDeviceIDs[] = {
    "MFG:HP;MDL:HP LaserJet;",
    "MFG:HP;MDL:LaserJet;",
    "MFG:HP;MDL:hp LaserJet  4;",
    "MFG:HP;MDL:HPLaserJet;",
    "MFG:HP;MDL:HP;",
    "MFG:HP;MDL:HP ;",
    "MFG:HP;MDL:HP   LaserJet;",
    "MFG:HP;MDL:HP HP LaserJet;",
    "MFG:HP;MDL:HP-LaserJet;",
    "MFG:HP;MDL:HP/LaserJet;",
    "MFG:HP;MDL:Hewlett-Packard LaserJet;",
    "MFG: HP ;MDL: HP LaserJet ;",
    "MFG:hp;MDL:HP LaserJet;",
    "MFG:Hewlett-Packard;MDL:HP LaserJet;",
    "MFG:Hewlett-Packard;MDL:Hewlett-Packard LaserJet;",
    "MFG:HEWLETT-PACKARD;MDL:hp psc;",
    "MFG:Hewlett Packard;MDL:HP LaserJet;",
    "MFG:hewlett-packard company;MDL:HP LaserJet;",
    "MFG:Lexmark International;MDL:Lexmark E120;",
    "MFG:lexmark international;MDL:E120;",
    "MFG:Lexmark International;MDL:Lexmark International E120;",
    "MFG:Lexmark International, Inc.;MDL:Lexmark E120;",
    "MFG:KONICA MINOLTA;MDL:KONICA MINOLTA magicolor 2300;",
    "MFG:KONICA MINOLTA;MDL:magicolor/2300 + (x) & y;",
    "MFG:EPSON;MDL:SEIKO EPSON X;",
    "MFG:K/M;MDL:K/M 100%;",
    "MFG:;MDL:A B;",
    "MFG:HP;MDL:;",
};

std::string uriOfQueue(const std::string& deviceID) {
    FakePlatform fakes;
    PPDManager drivers{fakes.platform};
    return USBPrinterObject(fakes.platform, drivers, 0x01400000, 0, 1008, 17, deviceID).deviceURI().value();
}

std::vector<ListedDevice> listed(const UsbBench& bench) {
    const TemporaryFolder folder;
    copyStockUsbBackend(folder / "usb");
    return listedDevices(runProgram({folder / "usb"}, {.environment = bench.environment()}).standardOutput);
}

/// The URI of the one device that the stock backend finds.
std::string uriInListing(const UsbBench& bench) {
    const auto devices = listed(bench);
    return devices.size() == 1 ? devices.front().uri : std::to_string(devices.size()) + " devices";
}

TEST(StockListing, IsTakenApartIntoDevices) {
    const std::vector<ListedDevice> expected{
        {"usb://HP/LaserJet?serial=1", "MFG:HP;MDL:LaserJet;SN:1;"},
        {"usb://A/x", "MFG:A;MDL:\"x\\;"},
        {"usb://B/y", ""},
        {"usb://C/z", ""},
    };
    EXPECT_EQ(listedDevices("direct usb://HP/LaserJet?serial=1 \"HP LaserJet\" \"HP LaserJet\" "
                            "\"MFG:HP;MDL:LaserJet;SN:1;\" \"\"\n"
                            "direct usb://A/x \"A \\\"x\\\\\" \"A \\\"x\\\\\" \"MFG:A;MDL:\\\"x\\\\;\" \"\"\n"
                            "direct usb \"Unknown\" \"USB printers\"\n"
                            "\n"
                            "nonsense\n"
                            "direct usb://B/y \"unclosed \\\n"
                            "direct   usb://C/z \"\" \"\""),
              expected);
    EXPECT_TRUE(listedDevices("").empty());
}

TEST(StockListing, MayHoldAnything) {
    constexpr std::string_view kPieces[] = {"direct ", "usb://", "\"",       "\\",  "\n",
                                            " ",       "MFG:x;", "?serial=", "%41", "%"};
    std::mt19937 random(20);
    for (int round = 0; round < 2000; ++round) {
        std::string listing;
        for (auto pieces = random() % 30; pieces > 0; --pieces)
            listing += kPieces[random() % std::size(kPieces)];
        for (const auto& device : listedDevices(listing)) {
            EXPECT_NE(device.uri.find("://"), std::string::npos) << listing;
            EXPECT_EQ(listedURI(device.uri, {device}), device.uri) << listing;
        }
    }
}

const std::vector<ListedDevice> kListed{
    {"usb://HP/LaserJet?serial=4334", "MFG:HP;MDL:HP LaserJet;SN:C4;"},
    {"usb://HP/LaserJet?serial=4435", "MFG:HP;MDL:HP LaserJet;SN:D5;"},
    {"usb://HP/LaserJet?serial=C4", "MFG:HP;MDL:HP LaserJet;"},
    {"usb://HP/DeskJet?serial=E6", "MFG:HP;MDL:DeskJet;SN:C4;"},
    {"usb://Brother/DCP-7030", "MFG:Brother;MDL:DCP-7030;SN:B7;"},
    {"usb://EPSON/XP%204?serial=20&interface=1", "MFG:EPSON;MDL:XP 4;SN: A%b;"},
};

struct ListedCase {
    const char* queue;
    std::optional<std::string> expected;
};
const ListedCase kQueues[] = {
    {"usb://HP/LaserJet?serial=4435", "usb://HP/LaserJet?serial=4435"},
    {"usb://HP/LaserJet?serial=D5", "usb://HP/LaserJet?serial=4435"},
    {"usb://HP/LaserJet?serial=C4", "usb://HP/LaserJet?serial=C4"},  // the bus before the device ID
    {"usb://HP/DeskJet?serial=C4", "usb://HP/DeskJet?serial=E6"},
    {"usb://HP/DeskJet?serial=D5", std::nullopt},
    {"usb://HP/LaserJet?serial=F7", std::nullopt},
    {"usb://Brother/DCP-7030?serial=B7", "usb://Brother/DCP-7030?serial=B7"},
    {"usb://Brother/DCP-7030?serial=B8", "usb://Brother/DCP-7030?serial=B8"},  // it tells none on the bus
    {"usb://EPSON/XP%204?serial=20", "usb://EPSON/XP%204?serial=20&interface=1"},
    {"usb://EPSON/XP%204?serial=%20A%25b", "usb://EPSON/XP%204?serial=20&interface=1"},
    {"usb://Canon/LBP?serial=C4", std::nullopt},
};

TEST(StockListing, HasAPrinterByItsSerialNumberOnTheBusOrInItsDeviceID) {
    for (const auto& [queue, expected] : kQueues)
        EXPECT_EQ(listedURI(queue, kListed), expected) << queue;
    EXPECT_EQ(listedURI(kQueues[0].queue, {}), std::nullopt);
}

TEST(StockListing, HasThePrintersOfOurQueuesByTheURIsThatWeMakeOfTheirs) {
    for (const std::string deviceID : kDeviceIDs) {
        UsbBench bench;
        bench.plugIn("1-4", {.deviceID = deviceID});
        EXPECT_EQ(stockDeviceURI(uriOfQueue(deviceID)), uriInListing(bench)) << deviceID;
    }
}

TEST(StockListing, HasTheSerialNumbersOfOurQueues) {
    for (const std::string serialNumber : {"C4", " 1 ", "A B/c?d&e%f#g"}) {
        const auto deviceID = "MFG:HP;MDL:HP LaserJet;SERN:" + serialNumber + ";";
        UsbBench bench;
        bench.plugIn("1-4", {.deviceID = deviceID, .serialNumber = serialNumber});
        EXPECT_EQ(stockDeviceURI(uriOfQueue(deviceID)), uriInListing(bench)) << serialNumber;
    }
}

TEST(StockListing, HasPrintersThatTellAnotherSerialNumberOnTheBus) {
    UsbBench bench;
    bench.plugIn("1-4", {.deviceID = "MFG:HP;MDL:HP LaserJet;SN:C4;", .serialNumber = "4334"});
    bench.plugIn("1-5", {.deviceID = "MFG:HP;MDL:HP LaserJet;SN:D5;", .serialNumber = "4435"});
    EXPECT_EQ(listedURI(stockDeviceURI(uriOfQueue("MFG:HP;MDL:HP LaserJet;SN:D5;")), listed(bench)),
              "usb://HP/LaserJet?serial=4435");
}

}  // namespace
}  // namespace ventras
