#include "queues/QueueMaker.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "devices/VellumProfilePrinterObject.h"
#include "tests/devices/FakeDevice.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/queues/LostGenericDriver.h"
#include "tests/queues/QueueMaking.h"

namespace ventras {
namespace {

using Text = std::optional<std::string>;

constexpr std::string_view kURI = "ipp://printer.local/ipp/print";
const DeviceDescription kDriverless{
    {"display-name", "Office"}, {"URF", "W8"}, {"pdl", "application/pdf,image/urf"}};

class Maker : public QueueMaking {
protected:
    // Makes the queue of a driverless printer that describes itself so.
    std::int32_t make(DeviceDescription description = kDriverless) {
        printer_.setAttributes(std::move(description));
        return makeFor(printer_);
    }

    VellumProfilePrinterObject printer_{fake_.platform, drivers_, std::string(kURI)};
};

TEST_F(Maker, MakesAQueueForADriverlessPrinter) {
    EXPECT_EQ(make(), 0);
    EXPECT_EQ(printer_.queueID(), "Office");
    ASSERT_EQ(printSystem_.creations.size(), 1U);
    EXPECT_EQ(printSystem_.creations[0].attributes,
              (PropertyDictionary{{"Printer URI", kURI},
                                  {"com.quillon.print.PrinterInfo.PMPrinterAddress", "Office"},
                                  {"com.quillon.print.PrinterInfo.PPD", *drivers_.genericURFPPD().name},
                                  {"Location", "Reading Room"}}));
    EXPECT_EQ(output_, "INFO:Determining printer's features...\nQueue ID:Office\n");
}

TEST_F(Maker, UsesThePPDThatOptionSelectionMade) {
    printSystem_.autoSelection.newPPDText = "a new PPD";
    EXPECT_EQ(make(), 0);
    const auto& creation = printSystem_.creations.at(0);
    EXPECT_EQ(creation.ppdText, "a new PPD");
    EXPECT_NE(*findText(creation.attributes, "com.quillon.print.PrinterInfo.PPD"),
              *drivers_.genericURFPPD().name);
}

TEST_F(Maker, FindsTheNewPPDInAFolderWithAnOddName) {
    const TemporaryFolder parent;
    const auto odd = parent / "a b%41?c#d";
    std::filesystem::create_directory(odd);
    const auto before = std::string(std::getenv("TMPDIR"));
    setenv("TMPDIR", odd.c_str(), 1);
    printSystem_.autoSelection.newPPDText = "a new PPD";
    EXPECT_EQ(make(), 0);
    setenv("TMPDIR", before.c_str(), 1);
    EXPECT_EQ(printSystem_.creations.at(0).ppdText, "a new PPD");
    EXPECT_TRUE(std::filesystem::is_empty(odd));
}

TEST_F(Maker, SelectsOptionsOnACopyOfTheDriverForABinaryChannel) {
    std::string text;
    printSystem_.autoSelection.onSelect = [&](auto&, const std::string& path) { text = readFile(path); };
    EXPECT_EQ(make(), 0);
    EXPECT_EQ(printSystem_.binaryOK, std::vector{true});
    ASSERT_EQ(printSystem_.autoSelected.size(), 1U);
    EXPECT_EQ(std::filesystem::path(printSystem_.autoSelected[0]).parent_path(), files_.folder());
    EXPECT_NE(text, "");
    EXPECT_EQ(text, readFile(*drivers_.genericURFPPD().name));
}

TEST_F(Maker, GivesTheQueueNoLocationWhenTheComputerHasNoName) {
    fake_.computerName.value.reset();
    EXPECT_EQ(make(), 0);
    EXPECT_FALSE(printSystem_.creations.at(0).attributes.contains("Location"));
}

TEST_F(Maker, MakesTheQueueTheDefaultWhenThePrintSystemWantsItSo) {
    EXPECT_EQ(make(), 0);
    EXPECT_EQ(printSystem_.defaults, std::vector<std::string>{"Office"});
    printSystem_.makesDefault = false;
    EXPECT_EQ(make(), 0);
    EXPECT_EQ(printSystem_.defaults, std::vector<std::string>{"Office"});
}

TEST_F(Maker, CannotHandleAPrinterWithoutNameURFOrItsDocumentFormat) {
    for (const std::string_view missing : {"display-name", "URF", "pdl"}) {
        auto description = kDriverless;
        description.erase(description.find(missing));
        EXPECT_EQ(make(description), 255) << missing;
    }
    for (const std::string_view pdl : {"application/pdf", "image/urf2", "application/pdf, image/urf", ""}) {
        auto description = kDriverless;
        description.insert_or_assign("pdl", pdl);
        EXPECT_EQ(make(description), 255) << pdl;
    }
    EXPECT_EQ(scheduler_.requests().size(), 0U);  // the queues are not even looked at
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printSystem_.autoSelected.size(), 0U);
    EXPECT_EQ(output_, "");
}

TEST_F(Maker, TakesAPrinterNamedByItsProductAndItsFormatsInAnyCase) {
    EXPECT_EQ(make({{"product", "(HP LaserJet)"}, {"URF", ""}, {"pdl", "IMAGE/URF"}}), 0);
    EXPECT_EQ(printer_.queueID(), "HP_LaserJet");
}

TEST_F(Maker, LeavesAPrinterAloneThatHasAQueue) {
    existing_ = {{"other", "ipp://other/"}, {"first", kURI}, {"second", kURI}};
    EXPECT_EQ(make(), 242);
    EXPECT_EQ(printer_.queueID(), "first");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printSystem_.autoSelected.size(), 0U);
    EXPECT_EQ(output_, "");
}

TEST_F(Maker, TakesAPrinterWithoutURIForServed) {
    VellumProfilePrinterObject withoutURI{fake_.platform, drivers_, std::nullopt};
    withoutURI.setAttributes(kDriverless);
    EXPECT_EQ(maker_.createQueueForDevice(withoutURI), 242);
    EXPECT_EQ(withoutURI.queueID(), "");
}

TEST_F(Maker, ForgetsTheQueueOfAnEarlierRound) {
    printer_.setQueueID("gone");
    printSystem_.create = [](const auto&) { return 73; };
    EXPECT_EQ(make(), 73);
    EXPECT_EQ(printer_.queueID(), std::nullopt);
}

TEST_F(Maker, HasNoDriverWhenTheGenericOneCannotBeFetched) {
    const LostGenericDriver lost(fake_, drivers_);
    EXPECT_EQ(make(), 241);
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printSystem_.autoSelected.size(), 0U);
}

TEST_F(Maker, CannotGoOnInABrokenInstallation) {
    const TemporaryFolder empty;
    fake_.resources.folder = empty.path();
    printer_.setAttributes(kDriverless);
    EXPECT_THROW(maker_.createQueueForDevice(printer_), InternalInconsistencyError);
}

TEST_F(Maker, HandsUpTheStatusOfOptionSelection) {
    printSystem_.autoSelection.createStatus = 69;
    EXPECT_EQ(make(), 69);
    EXPECT_EQ(output_, "");  // the features are not determined without a context
    printSystem_.autoSelection.createStatus = 0;
    printSystem_.autoSelection.optionsStatus = -7;
    printSystem_.autoSelection.newPPDText = "half a PPD";
    EXPECT_EQ(make(), -7);
    EXPECT_EQ(output_, "INFO:Determining printer's features...\n");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printer_.queueID(), std::nullopt);
}

TEST_F(Maker, HandsUpTheStatusOfQueueCreation) {
    printSystem_.create = [](const auto&) { return 77; };
    printSystem_.autoSelection.newPPDText = "a new PPD";
    EXPECT_EQ(make(), 77);
    EXPECT_EQ(printer_.queueID(), std::nullopt);
    EXPECT_EQ(printSystem_.removed, std::vector<std::string>{"Office"});
    printSystem_.suggestsNames = false;
    EXPECT_EQ(make(), -620);
    EXPECT_EQ(make({{"display-name", "a\x01"}, {"URF", "W8"}, {"pdl", "image/urf"}}), -30886);
}

TEST_F(Maker, CannotHandleADeviceOfAnUnknownKind) {
    FakeDevice unknown;
    EXPECT_EQ(maker_.createQueueForDevice(unknown), 255);
}

TEST_F(Maker, AppliesOptionsForTheChannelItIsTold) {
    testing::internal::CaptureStdout();
    EXPECT_EQ(maker_.applyInstallableOptions("usb://x", "/x.ppd", Channel::TextOnly).newPPD.has_value(),
              false);
    EXPECT_EQ(maker_.applyInstallableOptions("usb://x", "/x.ppd", Channel::Binary).status, 0);
    testing::internal::GetCapturedStdout();
    EXPECT_EQ(printSystem_.binaryOK, (std::vector{false, true}));
    EXPECT_EQ(printSystem_.autoSelected, (std::vector<std::string>{"/x.ppd", "/x.ppd"}));
}

PPDRecord record(std::string name, Text type = std::nullopt) {
    PPDRecord driver;
    driver.name = std::move(name);
    driver.type = std::move(type);
    return driver;
}

// One record of every kind, best first.
std::vector<PPDRecord> oneOfEachKind() {
    std::vector<PPDRecord> records(10);
    records[0].secureVellum = true;
    records[1] = record("/x/Vellum.ppd");
    records[2] = record("/x/localized.ppd");
    records[2].naturalLanguage = {"en"};
    records[3] = record("/x/installed.ppd");
    records[4].suDriverPredicate = "predicate";
    records[5].suDriverPredicate = "predicate";
    records[5].suDriverConflicts = "conflicts";
    records[6] = record("/x/hpijs.ppd");
    records[7] = record("drv:///sample.drv/x.ppd");
    records[7].naturalLanguage = {"en"};
    records[8] = record("drv:///sample.drv/y.ppd");
    records[9].filters = {"application/Tioga 0 -"};
    return records;
}

TEST(FirstPrinterDriver, IsOfAKindUpToSix) {
    const auto records = oneOfEachKind();
    for (unsigned kind = 0; kind < records.size(); ++kind) {
        ASSERT_EQ(PPDManager::ppdKind(records[kind]), kind);
        EXPECT_EQ(QueueMaker::firstPrinterDriver(std::vector{records[kind]}),
                  kind <= 6 ? std::optional{records[kind]} : std::nullopt)
            << kind;
    }
}

TEST(FirstPrinterDriver, IsTheFirstInTheListNotTheBest) {
    const auto records = oneOfEachKind();
    EXPECT_EQ(QueueMaker::firstPrinterDriver(std::vector{records[8], records[6], records[1]}), records[6]);
}

TEST(FirstPrinterDriver, IsNoFaxDriver) {
    const auto fax = record("/x/fax.ppd", "fax");
    const auto printer = record("/x/printer.ppd", "postscript");
    EXPECT_EQ(QueueMaker::firstPrinterDriver(std::vector{fax, printer}), printer);
    EXPECT_EQ(QueueMaker::firstPrinterDriver(std::vector{fax}), std::nullopt);
}

TEST(FirstPrinterDriver, IsAbsentInAnEmptyListAndWithoutAList) {
    EXPECT_EQ(QueueMaker::firstPrinterDriver(std::vector<PPDRecord>{}), std::nullopt);
    EXPECT_EQ(QueueMaker::firstPrinterDriver(std::nullopt), std::nullopt);
}

}  // namespace
}  // namespace ventras
