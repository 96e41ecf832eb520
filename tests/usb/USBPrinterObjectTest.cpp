#include "devices/USBPrinterObject.h"

#include <gmock/gmock.h>

#include <fstream>
#include <string>
#include <vector>

#include "drivers/PPDManager.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/PropertyList.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using namespace std::string_literals;
using testing::Optional;

constexpr std::uint32_t kPlace = 0xfa130000;

class UsbPrinter : public testing::Test {
protected:
    USBPrinterObject printer(std::optional<std::string> deviceID, std::uint32_t location = kPlace) {
        return {fakes.platform, drivers, location, 0, 1008, 17, std::move(deviceID)};
    }

    std::string uri(std::optional<std::string> deviceID, std::uint32_t location = kPlace) {
        return printer(std::move(deviceID), location).deviceURI().value();
    }

    QueueAttributes driverInfo(std::optional<std::string> deviceID, std::uint32_t location = kPlace) {
        return printer(std::move(deviceID), location).driverInfo({}).value();
    }

    FakePlatform fakes;
    PPDManager drivers{fakes.platform};
    TemporaryFolder folder;
};

TEST_F(UsbPrinter, KeepsTheFieldsItWasMadeWith) {
    const auto made = USBPrinterObject::usbPrinterObjectWithLocation(fakes.platform, drivers, kPlace, 2, 1008,
                                                                     17, "MFG:A;");
    EXPECT_EQ(made->location(), kPlace);
    EXPECT_EQ(made->interfaceNumber(), 2);
    EXPECT_EQ(made->vendorID(), 1008);
    EXPECT_EQ(made->productID(), 17);
    EXPECT_THAT(made->deviceID(), Optional("MFG:A;"s));
    EXPECT_EQ(made->queueID(), std::nullopt);
}

TEST_F(UsbPrinter, TakesNewFields) {
    auto made = printer("MFG:A;");
    made.setLocation(1);
    made.setInterfaceNumber(2);
    made.setVendorID(3);
    made.setProductID(4);
    made.setDeviceID(std::nullopt);
    EXPECT_EQ(made.description(), "loc:0x1 intf:2 vendor:3 prod:4 id:(null)");
}

TEST_F(UsbPrinter, DescribesItselfForTheLog) {
    EXPECT_EQ(printer("MFG:A;MDL:B;", 0x14100000).description(),
              "loc:0x14100000 intf:0 vendor:1008 prod:17 id:MFG:A;MDL:B;");
    EXPECT_EQ(printer("", 0xFFFFFFFF).description(), "loc:0xffffffff intf:0 vendor:1008 prod:17 id:");
}

TEST_F(UsbPrinter, IsWhatItsDeviceIDSays) {
    auto laser = printer("MFG:HP;MDL:HP LaserJet 4;CMD:PCL,PostScript;SN:X1;");
    EXPECT_THAT(laser.make(), Optional("HP"s));
    EXPECT_THAT(laser.model(), Optional("HP LaserJet 4"s));
    EXPECT_THAT(laser.serialNumber(), Optional("X1"s));
    EXPECT_THAT(laser.name(), Optional("HP LaserJet 4"s));
    EXPECT_THAT(laser.softwareUpdateScanDeviceID(), Optional("MANUFACTURER:HP;MODEL:LaserJet 4"s));
    EXPECT_TRUE(laser.supportsPCL());
    EXPECT_TRUE(laser.supportsPostscript());
}

TEST_F(UsbPrinter, WithoutADeviceIDIsUnknown) {
    auto nothing = printer(std::nullopt);
    EXPECT_EQ(nothing.make(), std::nullopt);
    EXPECT_EQ(nothing.model(), std::nullopt);
    EXPECT_EQ(nothing.serialNumber(), std::nullopt);
    EXPECT_THAT(nothing.name(), Optional("Unknown"s));
    EXPECT_EQ(nothing.softwareUpdateScanDeviceID(), std::nullopt);
    EXPECT_FALSE(nothing.supportsPCL());
}

TEST_F(UsbPrinter, HasAnEmptyListOfDriversWhenNothingFits) {
    const UseScheduler nobody(folder / "no-scheduler");
    EXPECT_EQ(printer("MFG:HP;MDL:LaserJet 1020;").driverList(), std::vector<PPDRecord>{});
}

// Device URI --------------------------------------------------------------------------------------

struct UriCase {
    std::string deviceID;
    std::uint32_t location;
    std::string expected;
};
const UriCase kUris[] = {
    {"MFG:HP;MDL:LaserJet 1020;SN:ABC;", 0xfa130000, "usb://HP/LaserJet%201020?serial=ABC"},
    {"MFG:HP;MDL:LaserJet 1020;SN:ABC;", 0, "usb://HP/LaserJet%201020?serial=ABC"},
    {"MFG:HP;MDL:LaserJet 1020;SN:ABC;", 0xFFFFFFFF, "usb://HP/LaserJet%201020?serial=ABC"},
    {"MFG:HP;MDL:LaserJet 1020;", 0xfa130000, "usb://HP/LaserJet%201020?location=fa130000"},
    {"MFG:HP;MDL:LaserJet 1020;", 0x00100000, "usb://HP/LaserJet%201020?location=100000"},
    {"MFG:HP;MDL:LaserJet 1020;", 0, "usb://HP/LaserJet%201020?location=0"},
    {"MFG:HP;MDL:LaserJet 1020;", 0xFFFFFFFF, "usb://HP/LaserJet%201020"},
    {"CMD:PCL;SN:ABC;", 0, "usb://Unknown/Unknown?serial=ABC"},
    {"CMD:PCL;", 0x10, "usb://Unknown/Unknown?location=10"},
    {"MFG: \tHP ;MDL: LaserJet\t;SN:ABC;", 0, "usb://HP/LaserJet?serial=ABC"},
    {"MFG:HP;MDL:X;SN: A B ;", 0, "usb://HP/X?serial=%20A%20B%20"},
    {"MFG:HP;MDL:X;SN:;", 0x10, "usb://HP/X?serial="},  // an empty serial number is one
    {"MFG:M\xc3\xbcller;MDL:\xc3\x89t\xc3\xa9;", 0, "usb://M%C3%BCller/%C3%89t%C3%A9?location=0"},
};

TEST_F(UsbPrinter, IsAddressedByMakeModelAndSerialNumberOrElseItsPlace) {
    for (const auto& [deviceID, location, expected] : kUris)
        EXPECT_EQ(uri(deviceID, location), expected) << deviceID;
}

TEST_F(UsbPrinter, WithTextTooLongForAUriHasAnEmptyOne) {
    EXPECT_EQ(uri("MFG:HP;MDL:" + std::string(2000, 'x') + ";SN:1;"), "");
    EXPECT_EQ(uri("MFG:" + std::string(2000, 'x') + ";MDL:A;SN:1;"), "");
}

// The same device? --------------------------------------------------------------------------------

struct ImageDeviceCase {
    std::string transport;
    std::uint32_t location;
    std::uint16_t vendor, product;
    bool same;
};
const ImageDeviceCase kImageDevices[] = {
    {"USB", kPlace, 1008, 17, true},
    {"TCP/IP", kPlace, 1008, 17, false},
    {"usb", kPlace, 1008, 17, false},
    {"USB", kPlace + 1, 1008, 17, false},
    {"USB", kPlace & 0xFFFFFF, 1008, 17, false},
    {"USB", kPlace, 1009, 17, false},
    {"USB", kPlace, 1008, 18, false},
    {"USB", kPlace, 17, 1008, false},
};

TEST_F(UsbPrinter, IsTheImageDeviceOfTheSamePlaceProductAndVendor) {
    for (const auto& [transport, location, vendor, product, same] : kImageDevices) {
        const ImageDevice device{.transport = transport,
                                 .usbLocation = location,
                                 .usbVendor = vendor,
                                 .usbProduct = product,
                                 .serialNumber = {},
                                 .txtRecord = {},
                                 .uuidString = {},
                                 .modulePath = {}};
        EXPECT_EQ(printer("MFG:A;").matchesIDDevice(device), same)
            << transport << " " << location << " " << vendor << " " << product;
    }
}

// Existing queues ---------------------------------------------------------------------------------

const std::string kLaser = "MFG:HP;MDL:LaserJet 1020;SN:ABC;";

QueueRecord queue(std::string name, std::optional<std::string> uri) {
    return {.printerName = std::move(name), .deviceURI = std::move(uri), .printerType = std::nullopt};
}

TEST_F(UsbPrinter, IsServedByTheFirstUsbQueueWithItsUri) {
    const QueueRecords queues{queue("a", "usb://HP/LaserJet%201020?serial=ABD"), queue("b", std::nullopt),
                              queue("c", "usb://HP/LaserJet%201020?serial=ABC"),
                              queue("d", "usb://HP/LaserJet%201020?serial=ABC")};
    EXPECT_THAT(printer(kLaser).matchExistingQueues(queues), Optional("c"s));
}

TEST_F(UsbPrinter, IsNotServedByQueuesOfOtherSchemesOrSpellings) {
    for (const auto* uri :
         {"dnssd://HP/LaserJet%201020?serial=ABC", "ipp://HP/LaserJet%201020?serial=ABC",
          "ippusb://HP/LaserJet%201020?serial=ABC", "USB://HP/LaserJet%201020?serial=ABC",
          "usb:/HP/LaserJet%201020?serial=ABC", "usb://HP/LaserJet%201020?serial=ABC&interface=1",
          "usb://HP/LaserJet%201020?serial=abc", ""})
        EXPECT_EQ(printer(kLaser).matchExistingQueues({queue("q", uri)}), std::nullopt) << uri;
    EXPECT_EQ(printer(kLaser).matchExistingQueues({}), std::nullopt);
}

TEST_F(UsbPrinter, MatchesByLocationOnlyWhileItStaysAndHasNoSerialNumber) {
    const QueueRecords queues{queue("q", "usb://HP/LaserJet%201020?location=fa130000")};
    const std::string withoutSerial = "MFG:HP;MDL:LaserJet 1020;";
    EXPECT_THAT(printer(withoutSerial).matchExistingQueues(queues), Optional("q"s));
    EXPECT_EQ(printer(withoutSerial, 0xfa140000).matchExistingQueues(queues), std::nullopt);
    EXPECT_EQ(printer(kLaser).matchExistingQueues(queues), std::nullopt);
}

TEST_F(UsbPrinter, WithoutAUriIsServedByNoQueue) {
    EXPECT_EQ(
        printer("MDL:" + std::string(2000, 'x')).matchExistingQueues({queue("q", "usb://HP/X?serial=1")}),
        std::nullopt);
}

// Attributes of a new queue -----------------------------------------------------------------------

TEST_F(UsbPrinter, DescribesItsQueue) {
    EXPECT_EQ(driverInfo(kLaser), (QueueAttributes{
                                      {"Printer URI", "usb://HP/LaserJet%201020?serial=ABC"},
                                      {"MODEL:", "LaserJet 1020"},
                                      {"MANUFACTURER:", "HP"},
                                      {"USBAddressLocationID", "fa130000"},
                                      {"SERN:", "ABC"},
                                  }));
}

TEST_F(UsbPrinter, DescribesItsQueueAsUnknownWithoutMakeAndModel) {
    EXPECT_EQ(driverInfo("CMD:PCL;", 0), (QueueAttributes{
                                             {"Printer URI", "usb://Unknown/Unknown?location=0"},
                                             {"MODEL:", "Unknown"},
                                             {"MANUFACTURER:", "Unknown"},
                                         }));
}

TEST_F(UsbPrinter, DoesNotTrimWhatItsQueueIsTold) {
    const auto info = driverInfo("MFG: HP ;MDL: X ;");
    EXPECT_EQ(*findText(info, "MODEL:"), " X ");
    EXPECT_EQ(*findText(info, "MANUFACTURER:"), " HP ");
}

TEST_F(UsbPrinter, TellsAnUnknownLocationButNotLocationZero) {
    EXPECT_FALSE(driverInfo(kLaser, 0).contains("USBAddressLocationID"));
    EXPECT_EQ(*findText(driverInfo(kLaser, 0xFFFFFFFF), "USBAddressLocationID"), "ffffffff");
}

/// A data folder with a list of devices whose serial numbers mean nothing.
class NoSerialNumberList : public UsbPrinter {
protected:
    void write(const std::string& text) {
        std::ofstream(folder.path() / "NoSerialNumber.xml") << text;
        fakes.resources.folder = folder.path();
    }

    static std::string list(const std::string& entry) {
        return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\"><dict>" + entry +
               "</dict></plist>\n";
    }
};

TEST_F(NoSerialNumberList, WithholdsTheSerialNumberOfADeviceOnIt) {
    for (const auto* value : {"<true/>", "<false/>", "<string></string>", "<integer>0</integer>"}) {
        write(list("<key>1008/17</key>"s + value));
        const auto info = driverInfo(kLaser);
        EXPECT_FALSE(info.contains("SERN:")) << value;
        EXPECT_EQ(*findText(info, "Printer URI"), "usb://HP/LaserJet%201020?serial=ABC") << value;
    }
}

TEST_F(NoSerialNumberList, LetsEveryOtherSerialNumberThrough) {
    write(list("<key>1008/18</key><true/><key>17/1008</key><true/><key>0x3f0/0x11</key><true/>"));
    EXPECT_EQ(*findText(driverInfo(kLaser), "SERN:"), "ABC");
}

TEST_F(NoSerialNumberList, LetsSerialNumbersThroughWhenItIsMissingOrBroken) {
    fakes.resources.folder = folder.path();
    EXPECT_EQ(*findText(driverInfo(kLaser), "SERN:"), "ABC");
    for (const auto* text :
         {"", "no list", "<plist version=\"1.0\"><array><string>1008/17</string></array></plist>"}) {
        write(text);
        EXPECT_EQ(*findText(driverInfo(kLaser), "SERN:"), "ABC") << text;
    }
}

TEST_F(NoSerialNumberList, ThatIsShippedParses) {
    const auto path = fakes.resources.pathForResource("NoSerialNumber", "xml");
    ASSERT_TRUE(path);
    const auto text = readFile(*path);
    const auto parsed = parsePropertyList(text);
    ASSERT_TRUE(parsed) << text;
    EXPECT_TRUE(std::holds_alternative<PropertyDictionary>(*parsed));
}

}  // namespace
}  // namespace ventras
