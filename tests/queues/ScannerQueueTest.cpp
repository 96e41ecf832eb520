#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "devices/ScannerObject.h"
#include "devices/USBPrinterObject.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/queues/QueueMaking.h"

namespace ventras {
namespace {

class ScannerQueue : public QueueMaking {
protected:
    void SetUp() override {
        scanner_.setName("Flatbed");
        scanner_.setModulePath("/lib/module");
    }

    void joinPrinter() {
        scanner_.setPrinter(USBPrinterObject::usbPrinterObjectWithLocation(fake_.platform, drivers_, 1, 0, 3,
                                                                           2, "MFG:Acme;MDL:Multi;SN:7;"));
    }

    ScannerObject scanner_{fake_.computerName, "uuid-1", "P", 1, 2, 3};
};

TEST_F(ScannerQueue, IsMadeForAScannerOnly) {
    EXPECT_EQ(makeFor(scanner_), 0);
    EXPECT_EQ(scanner_.queueID(), "Flatbed");
    ASSERT_EQ(printSystem_.creations.size(), 1U);
    const auto& creation = printSystem_.creations[0];
    EXPECT_EQ(creation.ppdText.substr(creation.ppdText.find("*NickName")),
              "*NickName: \"Flatbed\"\n"
              "*QLScannerOnly: True\n"
              "*QLScannerUUID: \"uuid-1\"\n"
              "*QLPersistentIDString: \"P\"\n"
              "*QLScannerModulePath: \"/lib/module\"\n"
              "*QLICADriver: True\n"
              "*cupsLanguages: \"en\"\n");
    auto attributes = creation.attributes;
    EXPECT_EQ(attributes.erase("com.quillon.print.PrinterInfo.PPD"), 1U);
    EXPECT_EQ(attributes,
              (PropertyDictionary{
                  {"Printer URI", "usb://uuid-1"}, {"Scanner", true}, {"Location", "Reading Room"}}));
    EXPECT_EQ(output_, "Queue ID:Flatbed\n");  // no features are determined for a scanner
}

TEST_F(ScannerQueue, NeverBecomesTheDefault) {
    EXPECT_EQ(makeFor(scanner_), 0);
    EXPECT_EQ(printSystem_.defaults, std::vector<std::string>{});
}

TEST_F(ScannerQueue, OfAScannerWithoutANameIsUnknown) {
    scanner_.setName(std::nullopt);
    EXPECT_EQ(makeFor(scanner_), 0);
    EXPECT_EQ(scanner_.queueID(), "Unknown");
}

TEST_F(ScannerQueue, IsMadeOnce) {
    existing_ = {{"scans", "usb://uuid-1"}};
    EXPECT_EQ(makeFor(scanner_), 242);
    EXPECT_EQ(scanner_.queueID(), "scans");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
}

TEST_F(ScannerQueue, HandsUpTheStatusOfCreation) {
    printSystem_.create = [](const auto&) { return 65; };
    EXPECT_EQ(makeFor(scanner_), 65);
    EXPECT_EQ(scanner_.queueID(), std::nullopt);
}

TEST_F(ScannerQueue, CannotBeMadeWithoutAPlaceForItsPPD) {
    std::filesystem::remove(files_.folder());
    EXPECT_EQ(makeFor(scanner_), 255);
    std::filesystem::create_directory(files_.folder());
}

TEST_F(ScannerQueue, OfAMultifunctionDeviceIsThePrintersOwn) {
    joinPrinter();
    existing_ = {{"other", "usb://Acme/Multi?serial=8"}, {"office", "usb://Acme/Multi?serial=7"}};
    printSystem_.queuePPDs["office"] = "*PPD-Adobe: \"4.3\"\n*ModelName: \"Multi\"\n";
    EXPECT_EQ(makeFor(scanner_), 242);
    EXPECT_EQ(scanner_.queueID(), "office");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    const std::pair<std::string, std::string> rewritten{"office",
                                                        "*PPD-Adobe: \"4.3\"\n*ModelName: \"Multi\"\n"
                                                        "*QLScannerUUID: \"uuid-1\"\n"
                                                        "*QLScannerModulePath: \"/lib/module\"\n"
                                                        "*QLICADriver: \"True\"\n\n"};
    EXPECT_EQ(printSystem_.setPPDs, std::vector{rewritten});
}

TEST_F(ScannerQueue, OfAMultifunctionDeviceNeedsThePrintersQueue) {
    joinPrinter();
    existing_ = {{"other", "usb://Acme/Multi?serial=8"}};
    EXPECT_EQ(makeFor(scanner_), 255);
    EXPECT_EQ(scanner_.queueID(), std::nullopt);
    EXPECT_EQ(printSystem_.setPPDs.size(), 0U);
}

}  // namespace
}  // namespace ventras
