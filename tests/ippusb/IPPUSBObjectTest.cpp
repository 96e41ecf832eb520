#include "devices/IPPUSBObject.h"

#include <gtest/gtest.h>

#include "drivers/PPDManager.h"
#include "platform/ImageDeviceBrowser.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

using Txt = std::optional<DeviceDescription>;
using Texts = std::vector<std::string>;

constexpr std::int64_t kFax = 0x40000;
const std::string kUUID = "12345678-9abc-def0-1234-56789abcdef0";

// Nobody answers DNS-SD queries in this program: a printer without a dictionary stays without.
struct IPPUSBPrinter : testing::Test {
    FakePlatform fake;
    PPDManager drivers{fake.platform};

    std::shared_ptr<IPPUSBObject> printer(Txt txt, std::string name = "Laser 9 (USB)") {
        auto object = IPPUSBObject::ippUSBObjectWithRegisteredName(drivers, std::move(name));
        object->setTxtDictionary(std::move(txt));
        return object;
    }
};

struct NameCase {
    Txt txt;
    std::string expected;
};

const NameCase kNames[] = {
    {{{{"usb_MFG", "HP"}, {"usb_MDL", "HP LaserJet"}}}, "HP LaserJet"},
    {{{{"usb_MFG", "Acme"}, {"usb_MDL", "Laser 9"}}}, "Acme Laser 9"},
    {{{{"usb_MFG", " Acme\t"}, {"usb_MDL", "\t Laser 9 "}}}, "Acme Laser 9"},
    {{{{"usb_MDL", " Laser 9 "}}}, "Laser 9"},
    {{{{"usb_MFG", "Acme"}}}, "Registered"},     // the make alone is no name
    {{{{"usb_mdl", "Laser 9"}}}, "Registered"},  // keys are exact
    {{{{"ty", "Acme Laser 9"}}}, "Registered"},
    {DeviceDescription{}, "Registered"},
    {std::nullopt, "Registered"},
};

TEST_F(IPPUSBPrinter, IsNamedAfterMakeAndModelElseByItsRegisteredName) {
    for (const auto& [txt, expected] : kNames)
        EXPECT_EQ(printer(txt, "Registered")->name(), expected)
            << testing::PrintToString(txt.value_or(DeviceDescription{}));
}

struct AddressCase {
    std::string registeredName, uuid, expected;
};

const AddressCase kAddresses[] = {
    {"Laser 9 (USB)", kUUID, "ippusb://Laser%209%20(USB)._ipp._tcp.local./?uuid=" + kUUID},
    {"Laser", "", "ippusb://Laser._ipp._tcp.local./"},
    {"A/B.C", "", "ippusb://A%2FB.C._ipp._tcp.local./"},
    {"B\xc3\xbcro", "", "ippusb://B%C3%BCro._ipp._tcp.local./"},
    {"say \"hi\" @ 100%", "", "ippusb://say%20%22hi%22%20%40%20100%25._ipp._tcp.local./"},
    {"Laser", "a b", "ippusb://Laser._ipp._tcp.local./?uuid=a%20b"},
};

TEST_F(IPPUSBPrinter, IsAddressedByItsNameInDnsSdAndItsUUID) {
    for (const auto& [name, uuid, expected] : kAddresses) {
        DeviceDescription txt{{"rp", "ipp/print"}};
        if (!uuid.empty())
            txt["UUID"] = uuid;
        EXPECT_EQ(printer(txt, name)->deviceURI(), expected) << name;
    }
}

TEST_F(IPPUSBPrinter, HasNoAddressWithoutTXTValues) {
    EXPECT_EQ(printer(std::nullopt)->deviceURI(), "");
    EXPECT_EQ(printer(DeviceDescription{})->deviceURI(), "");
}

TEST_F(IPPUSBPrinter, MayBeKnownByItsUsbIdentityFirstAndThenByItsAddress) {
    const auto known =
        printer({{{"usb_MFG", " Acme "}, {"usb_MDL", " Laser 9 "}, {"usb_SN", "A1"}, {"UUID", kUUID}}});
    EXPECT_EQ(known->uris(), (Texts{"usb://Acme/Laser%209?serial=A1",
                                    "ippusb://Laser%209%20(USB)._ipp._tcp.local./?uuid=" + kUUID}));
}

TEST_F(IPPUSBPrinter, IsKnownAsUnknownWhereItDoesNotSay) {
    EXPECT_EQ(printer({{{"rp", "ipp/print"}}}, "Laser")->uris(),
              (Texts{"usb://Unknown/Unknown?serial=(null)", "ippusb://Laser._ipp._tcp.local./"}));
}

TEST_F(IPPUSBPrinter, KeepsBlanksOfItsSerialNumber) {
    EXPECT_EQ(printer({{{"usb_MFG", "A"}, {"usb_MDL", "B"}, {"usb_SN", " 1 "}}})->uris().front(),
              "usb://A/B?serial=%201%20");
}

TEST_F(IPPUSBPrinter, IsNotKnownByAnythingWithoutTXTValues) {
    EXPECT_EQ(printer(std::nullopt)->uris(), Texts{});
    EXPECT_EQ(printer(DeviceDescription{})->uris(), Texts{});
}

TEST_F(IPPUSBPrinter, FaxesWhenItsFaxResourceIsTheUsualOne) {
    EXPECT_TRUE(printer({{{"rfo", "ipp/faxout"}}})->supportsFax());
    for (const char* other : {"ipp/faxout/", "/ipp/faxout", "IPP/faxout", "ipp/fax", "", "ipp/faxout "})
        EXPECT_FALSE(printer({{{"rfo", other}}})->supportsFax()) << other;
    EXPECT_FALSE(printer({{{"RFO", "ipp/faxout"}}})->supportsFax());
    EXPECT_FALSE(printer({{{"Fax", "T"}}})->supportsFax());
    EXPECT_FALSE(printer(std::nullopt)->supportsFax());
}

const DeviceDescription kLaser{{"usb_MFG", "Acme"}, {"usb_MDL", "Laser"}, {"usb_SN", "A1"}};
const std::string kUsbURI = "usb://Acme/Laser?serial=A1";
const std::string kIppUsbURI = "ippusb://Laser._ipp._tcp.local./";

QueueRecord queue(std::string name, std::string uri, std::optional<std::int64_t> type = 0) {
    return {std::move(name), std::move(uri), type};
}

TEST_F(IPPUSBPrinter, IsServedByTheFirstQueueForAnyOfItsURIs) {
    const auto laser = printer(kLaser, "Laser");
    EXPECT_EQ(laser->matchExistingQueues(
                  {queue("x", "usb://Acme/Laser?serial=A2"), queue("u", kUsbURI), queue("i", kIppUsbURI)}),
              "u");
    EXPECT_EQ(laser->matchExistingQueues({queue("i", kIppUsbURI), queue("u", kUsbURI)}), "i");
    EXPECT_EQ(laser->matchExistingQueues({queue("x", kUsbURI + "0"), queue("y", "")}), std::nullopt);
    EXPECT_EQ(laser->matchExistingQueues({}), std::nullopt);
}

TEST_F(IPPUSBPrinter, IsServedByItsFaxQueueToo) {
    EXPECT_EQ(printer(kLaser, "Laser")->matchExistingQueues({queue("fax", kIppUsbURI, kFax)}), "fax");
}

TEST_F(IPPUSBPrinter, FaxesThroughTheFirstQueueWithTheFaxBit) {
    const auto laser = printer(kLaser, "Laser");
    const QueueRecords queues{queue("print", kUsbURI, 0x4104c & ~kFax),
                              queue("untyped", kIppUsbURI, std::nullopt),
                              queue("other", "usb://Acme/Laser", kFax), queue("fax", kUsbURI, kFax | 4)};
    EXPECT_EQ(laser->matchExistingFaxQueue(queues), "fax");
    EXPECT_EQ(laser->matchExistingFaxQueue({queues[0], queues[1], queues[2]}), std::nullopt);
}

TEST_F(IPPUSBPrinter, HasANamelessQueueWhereTheRecordHasNoName) {
    const QueueRecords queues{{std::nullopt, kUsbURI, kFax}, queue("later", kUsbURI, kFax)};
    EXPECT_EQ(printer(kLaser, "Laser")->matchExistingQueues(queues), std::nullopt);
    EXPECT_EQ(printer(kLaser, "Laser")->matchExistingFaxQueue(queues), std::nullopt);
}

TEST_F(IPPUSBPrinter, GivesAnEmptyQueueNameWithoutTXTValues) {
    for (const auto& txt : {Txt{}, Txt{DeviceDescription{}}}) {
        EXPECT_EQ(printer(txt)->matchExistingQueues({queue("q", "")}), "");
        EXPECT_EQ(printer(txt)->matchExistingFaxQueue({queue("q", "", kFax)}), "");
    }
}

TEST_F(IPPUSBPrinter, DescribesItsQueueWithMakeAndModelCrossed) {
    const auto info = printer({{{"usb_MFG", " HP "}, {"usb_MDL", "HP LaserJet"}, {"UUID", kUUID}}}, "Laser")
                          ->driverInfo({});
    EXPECT_EQ(info, (QueueAttributes{{"Printer URI", "ippusb://Laser._ipp._tcp.local./?uuid=" + kUUID},
                                     {"MODEL:", "HP"},
                                     {"MANUFACTURER:", "HP LaserJet"}}));
}

TEST_F(IPPUSBPrinter, DescribesItsQueueAsUnknownWhereItDoesNotSay) {
    EXPECT_EQ(printer(DeviceDescription{})->driverInfo({}),
              (QueueAttributes{{"Printer URI", ""}, {"MODEL:", "Unknown"}, {"MANUFACTURER:", "Unknown"}}));
}

TEST_F(IPPUSBPrinter, DescribesNoQueueWithoutARecord) {
    EXPECT_EQ(printer(std::nullopt)->driverInfo({}), std::nullopt);
}

TEST_F(IPPUSBPrinter, TakesTheGenericURFDriverAlone) {
    EXPECT_EQ(printer(std::nullopt)->driverList(), std::vector{drivers.genericURFPPD()});
}

ImageDevice usbScanner(std::string serialNumber, std::uint16_t vendor = 1008, std::uint16_t product = 17) {
    ImageDevice scanner;
    scanner.transport = ImageDeviceTransport::kUSB;
    scanner.serialNumber = std::move(serialNumber);
    scanner.usbVendor = vendor;
    scanner.usbProduct = product;
    return scanner;
}

ImageDevice networkScanner(std::string txtRecord) {
    ImageDevice scanner;
    scanner.transport = ImageDeviceTransport::kTCPIP;
    scanner.txtRecord = std::move(txtRecord);
    return scanner;
}

struct UsbCase {
    std::string serialNumber, product, vendor;
    bool expected;
};

const UsbCase kUsbTwins[] = {
    {"A1", "17", "1008", true},     {"A1", "18", "1008", false}, {"A1", "17", "1009", false},
    {"A2", "17", "1008", false},    {"", "17", "1008", false},   {"A1", "0x11", "1008", false},
    {"A1", "17abc", " 1008", true},  // as much as is a number counts
};

TEST_F(IPPUSBPrinter, IsTheUsbScannerOfItsSerialNumberProductAndVendor) {
    const auto scanner = usbScanner("A1");
    for (const auto& [serialNumber, product, vendor, expected] : kUsbTwins) {
        DeviceDescription txt{{"usb_PID", product}, {"usb_VID", vendor}};
        if (!serialNumber.empty())
            txt["usb_SN"] = serialNumber;
        EXPECT_EQ(printer(txt)->matchesIDDevice(scanner), expected) << serialNumber << product << vendor;
    }
}

TEST_F(IPPUSBPrinter, IsNoScannerWithoutSerialNumberHoweverWellTheRestFits) {
    const auto scanner = usbScanner("");
    EXPECT_FALSE(printer({{{"usb_PID", "17"}, {"usb_VID", "1008"}}})->matchesIDDevice(scanner));
    EXPECT_FALSE(printer(std::nullopt)->matchesIDDevice(scanner));
}

TEST_F(IPPUSBPrinter, HasVendorAndProductZeroWhereItDoesNotSay) {
    EXPECT_TRUE(printer({{{"usb_SN", "A1"}}})->matchesIDDevice(usbScanner("A1", 0, 0)));
}

TEST_F(IPPUSBPrinter, IsTheNetworkScannerOfItsUUID) {
    const auto laser = printer({{{"UUID", "ab12"}}});
    EXPECT_TRUE(laser->matchesIDDevice(networkScanner("\x09UUID=ab12")));
    EXPECT_FALSE(laser->matchesIDDevice(networkScanner("\x09UUID=AB12")));
    EXPECT_FALSE(laser->matchesIDDevice(networkScanner("\x07UUID=\xff\xfe")));
    EXPECT_FALSE(laser->matchesIDDevice(networkScanner("\x04ty=X")));
    EXPECT_FALSE(laser->matchesIDDevice(networkScanner("")));
    EXPECT_FALSE(printer({{{"ty", "X"}}})->matchesIDDevice(networkScanner("\x04ty=X")));
    EXPECT_FALSE(printer(std::nullopt)->matchesIDDevice(networkScanner("\x09UUID=ab12")));
}

TEST_F(IPPUSBPrinter, IsNoDeviceOfAnotherTransport) {
    auto fireWire = usbScanner("A1");
    fireWire.transport = ImageDeviceTransport::kFireWire;
    fireWire.txtRecord = "\x09UUID=ab12";
    const auto laser =
        printer({{{"UUID", "ab12"}, {"usb_SN", "A1"}, {"usb_PID", "17"}, {"usb_VID", "1008"}}});
    EXPECT_FALSE(laser->matchesIDDevice(fireWire));
}

TEST_F(IPPUSBPrinter, IsInDifficultyWhileItTellsNothing) {
    EXPECT_EQ(printer(kLaser)->difficulty(), std::nullopt);
    for (const auto& txt : {Txt{}, Txt{DeviceDescription{}}})
        EXPECT_TRUE(printer(txt)->difficulty().has_value());
}

TEST_F(IPPUSBPrinter, HasNoScanIDForSoftware) {
    EXPECT_EQ(printer(kLaser)->softwareUpdateScanDeviceID(), std::nullopt);
}

}  // namespace
}  // namespace ventras
