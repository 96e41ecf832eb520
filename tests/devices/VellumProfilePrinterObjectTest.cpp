#include "devices/VellumProfilePrinterObject.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

#include "drivers/PPDManager.h"
#include "platform/ImageDeviceBrowser.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

using Text = std::optional<std::string>;
using Texts = std::optional<std::vector<std::string>>;

constexpr std::string_view kURI = "ipp://printer.local/ipp/print";

// A printer whose description is given instead of asked for.
class VellumPrinter : public testing::Test {
protected:
    VellumProfilePrinterObject& described(DeviceDescription attributes) {
        printer_.setAttributes(std::move(attributes));
        return printer_;
    }

    FakePlatform fake_;
    PPDManager drivers_{fake_.platform};
    VellumProfilePrinterObject printer_{fake_.platform, drivers_, std::string(kURI)};
    VellumProfilePrinterObject withoutURI_{fake_.platform, drivers_, std::nullopt};
};

TEST_F(VellumPrinter, IsNamedByItsServiceNameElseByItsProductWithoutParentheses) {
    const std::vector<std::pair<DeviceDescription, Text>> cases{
        {{{"display-name", "Office"}, {"product", "(HP LaserJet)"}}, "Office"},
        {{{"display-name", ""}, {"product", "(HP LaserJet)"}}, ""},
        {{{"display-name", "(Office)"}}, "(Office)"},
        {{{"product", "(HP LaserJet)"}}, "HP LaserJet"},
        {{{"product", "((HP LaserJet))"}}, "(HP LaserJet)"},
        {{{"product", "HP LaserJet"}}, "HP LaserJet"},
        {{{"product", "(HP LaserJet"}}, "(HP LaserJet"},
        {{{"product", "HP LaserJet)"}}, "HP LaserJet)"},
        {{{"product", "(HP) LaserJet"}}, "(HP) LaserJet"},
        {{{"product", "()"}}, ""},
        {{{"product", "("}}, "("},
        {{{"product", ")"}}, ")"},
        {{{"product", ""}}, ""},
        {{{"note", "Lab"}}, std::nullopt},
        {{}, std::nullopt},
    };
    for (const auto& [attributes, expected] : cases)
        EXPECT_EQ(described(attributes).name(), expected) << printer_.description();
}

TEST_F(VellumPrinter, ReadsEachFactUnderItsKey) {
    auto& full = described({{"note", "Lab 3"},
                            {"UUID", "12-34"},
                            {"URF", "W8,SRGB24"},
                            {"product", "(HP LaserJet)"},
                            {"Duplex", "F"}});
    EXPECT_EQ(full.location(), "Lab 3");
    EXPECT_EQ(full.uuid(), "12-34");
    EXPECT_EQ(full.urf(), "W8,SRGB24");
    EXPECT_EQ(full.product(), "(HP LaserJet)");
    EXPECT_EQ(full.duplex(), "F");
}

TEST_F(VellumPrinter, HasNoFactThatItsDescriptionDoesNotHold) {
    auto& empty = described({});
    EXPECT_EQ(empty.location(), std::nullopt);
    EXPECT_EQ(empty.uuid(), std::nullopt);
    EXPECT_EQ(empty.urf(), std::nullopt);
    EXPECT_EQ(empty.product(), std::nullopt);
    EXPECT_EQ(empty.duplex(), std::nullopt);
    EXPECT_EQ(empty.pdl(), std::nullopt);
}

TEST_F(VellumPrinter, ListsItsDocumentFormatsInLowerCase) {
    const std::vector<std::pair<std::string, Texts>> cases{
        {"application/pdf,image/urf", {{"application/pdf", "image/urf"}}},
        {"Application/PDF,image/URF", {{"application/pdf", "image/urf"}}},
        {"image/urf", {{"image/urf"}}},
        {"image/urf,,x", {{"image/urf", "", "x"}}},
        {"image/urf, x", {{"image/urf", " x"}}},
        {"", {{""}}},
    };
    for (const auto& [pdl, expected] : cases)
        EXPECT_EQ(described({{"pdl", pdl}}).pdl(), expected) << pdl;
}

TEST_F(VellumPrinter, NeedsNoDriverOfItsOwn) {
    EXPECT_EQ(printer_.browserIdentifier(), "Vellum Profile");
    EXPECT_FALSE(printer_.selectStandardDefaults());
    EXPECT_TRUE(printer_.canDetermineDriver());
    EXPECT_EQ(printer_.matchPPDBasedDrivers().size(), 0U);
    EXPECT_EQ(printer_.driverList(), std::vector{drivers_.genericURFPPD()});
}

TEST_F(VellumPrinter, HasTheURIThatItWasMadeWithAsItsDeviceURI) {
    EXPECT_EQ(printer_.deviceURI(), kURI);
    EXPECT_EQ(printer_.uri(), kURI);
    EXPECT_EQ(withoutURI_.deviceURI(), std::nullopt);
    EXPECT_EQ(VellumProfilePrinterObject::initVellumProfilePrinterObjectWithURI(fake_.platform, drivers_,
                                                                                "ipps://x")
                  ->deviceURI(),
              "ipps://x");
}

TEST_F(VellumPrinter, GivesNothingOfTheBaseInterfaceThatItDoesNotKnow) {
    EXPECT_EQ(printer_.softwareUpdateScanDeviceID(), std::nullopt);
    EXPECT_FALSE(printer_.supportsPCL());
    EXPECT_FALSE(printer_.supportsPostscript());
    EXPECT_EQ(printer_.queueID(), std::nullopt);
}

TEST_F(VellumPrinter, IsServedByTheFirstQueueOfExactlyItsURI) {
    const std::string uri(kURI);
    const std::vector<std::pair<QueueRecords, Text>> cases{
        {{}, std::nullopt},
        {{{"a", "ipp://other/ipp/print", 0}}, std::nullopt},
        {{{"a", uri, 0}}, "a"},
        {{{"x", "usb://x", 0}, {"a", uri, 0}, {"b", uri, 0}}, "a"},
        {{{"a", "ipp://PRINTER.local/ipp/print", 0}}, std::nullopt},
        {{{"a", uri + "/", 0}}, std::nullopt},
        {{{"a", "ipps://printer.local/ipp/print", 0}}, std::nullopt},
        {{{"a", std::nullopt, 0}, {"b", uri, 0}}, "b"},
        {{{"fax", uri, 0x40000}}, "fax"},
        {{{std::nullopt, uri, 0}}, std::nullopt},
    };
    for (const auto& [queues, expected] : cases)
        EXPECT_EQ(printer_.matchExistingQueues(queues), expected) << queues.size() << " queues";
}

TEST_F(VellumPrinter, CannotTellItsQueueWithoutAURI) {
    EXPECT_EQ(withoutURI_.matchExistingQueues({}), "");
    EXPECT_EQ(withoutURI_.matchExistingQueues({{"a", std::nullopt, 0}, {"b", std::string(kURI), 0}}), "");
}

ImageDevice imageDevice(std::string_view transport, std::string txtRecord) {
    ImageDevice device;
    device.transport = transport;
    device.txtRecord = std::move(txtRecord);
    device.uuidString = "12-aB";
    return device;
}

TEST_F(VellumPrinter, IsTheNetworkImageDeviceOfTheSameUUID) {
    using namespace ImageDeviceTransport;
    const std::string record = "\x09txtvers=1\x0aUUID=12-aB";
    const std::vector<std::pair<ImageDevice, bool>> cases{
        {imageDevice(kTCPIP, record), true},
        {imageDevice(kUSB, record), false},
        {imageDevice(kFireWire, record), false},
        {imageDevice(kBluetooth, record), false},
        {imageDevice("", record), false},
        {imageDevice(kTCPIP, "\x0aUUID=12-ab"), false},
        {imageDevice(kTCPIP, "\x0auuid=12-aB"), false},
        {imageDevice(kTCPIP, "\x0aUUID=12-a\xff"), false},
        {imageDevice(kTCPIP, "\x04UUID"), false},
        {imageDevice(kTCPIP, ""), false},
    };
    for (const auto& [device, expected] : cases) {
        EXPECT_EQ(described({{"UUID", "12-aB"}}).matchesIDDevice(device), expected)
            << device.transport << ' ' << device.txtRecord;
        EXPECT_FALSE(described({}).matchesIDDevice(device)) << device.transport << ' ' << device.txtRecord;
    }
}

PPDRecord driver(std::string name) {
    PPDRecord record;
    record.name = std::move(name);
    return record;
}

TEST_F(VellumPrinter, DescribesItsQueueByURINameAndDriver) {
    EXPECT_EQ(described({{"display-name", "Office"}, {"product", "(HP LaserJet)"}})
                  .driverInfo(driver("/x/Vellum.ppd")),
              (QueueAttributes{{"Printer URI", kURI},
                               {"com.quillon.print.PrinterInfo.PMPrinterAddress", "Office"},
                               {"com.quillon.print.PrinterInfo.PPD", "/x/Vellum.ppd"}}));
}

TEST_F(VellumPrinter, TellsMakeAndModelOfAQueueOnlyFromAProductThatIsADeviceID) {
    const std::string deviceID = "MFG:Acme;MDL:Laser 5;";
    EXPECT_EQ(described({{"product", deviceID}}).driverInfo(driver("p")),
              (QueueAttributes{{"Printer URI", kURI},
                               {"com.quillon.print.PrinterInfo.PMPrinterAddress", deviceID},
                               {"com.quillon.print.PrinterInfo.PPD", "p"},
                               {"MODEL:", "Laser 5"},
                               {"MANUFACTURER:", "Acme"}}));
    EXPECT_EQ(described({{"product", "MDL:Laser 5;"}}).driverInfo(driver("p"))->contains("MANUFACTURER:"),
              false);
}

TEST_F(VellumPrinter, DescribesNoQueueWithoutAName) {
    EXPECT_EQ(described({{"note", "Lab"}}).driverInfo(driver("p")), std::nullopt);
}

TEST_F(VellumPrinter, LeavesOutOfItsQueuesDescriptionWhatIsAbsent) {
    withoutURI_.setAttributes({{"display-name", "Office"}});
    EXPECT_EQ(withoutURI_.driverInfo({}),
              (QueueAttributes{{"com.quillon.print.PrinterInfo.PMPrinterAddress", "Office"}}));
}

TEST_F(VellumPrinter, DescribesItselfForLogLines) {
    EXPECT_EQ(described({{"note", "Lab"}, {"URF", "W8"}}).description(),
              "URI=ipp://printer.local/ipp/print Attributes={URF = W8; note = Lab; }");
    withoutURI_.setAttributes({});
    EXPECT_EQ(withoutURI_.description(), "URI=(null) Attributes={}");
}

TEST_F(VellumPrinter, SaysWhatKeepsItFromADriverlessQueue) {
    struct Case {
        DeviceDescription attributes;
        std::string_view mentions;  // empty: nothing is wrong
    };
    const std::vector<Case> cases{
        {{{"display-name", "n"}, {"URF", "W8"}, {"pdl", "image/urf"}}, ""},
        {{{"URF", "W8"}, {"pdl", "image/urf"}}, "name"},
        {{{"display-name", "n"}, {"pdl", "image/urf"}}, "image/urf"},
        {{{"display-name", "n"}, {"URF", "W8"}}, "image/urf"},
        {{{"display-name", "n"}, {"URF", "W8"}, {"pdl", "application/pdf"}}, "image/urf"},
    };
    for (const auto& [attributes, mentions] : cases) {
        const auto difficulty = described(attributes).difficulty();
        EXPECT_EQ(difficulty.has_value(), !mentions.empty()) << printer_.description();
        EXPECT_NE(difficulty.value_or("").find(mentions), std::string::npos) << difficulty.value_or("");
    }
}

}  // namespace
}  // namespace ventras
