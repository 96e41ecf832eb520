#include "platform/linux/scheduler/CupsPrintSystem.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

#include "platform/PropertyList.h"
#include "platform/QueueAttributes.h"
#include "platform/linux/PlistPreferenceStore.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PpdTexts.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

const std::string kDevice = "ipp://printer.example/ipp/print";
const std::map<std::string, std::string> kOptions{{"PC WSItem User Name", "Acme Laser (2nd floor)"}};

/// A print system on a scheduler of its own.
class CupsPrintSystemTest : public testing::Test {
protected:
    std::string attributes(const std::string& uri, const std::string& ppdText, PropertyDictionary more = {}) {
        more.emplace("Printer URI", uri);
        more.emplace("com.quillon.print.PrinterInfo.PPD", folder_.write("driver.ppd", ppdText).string());
        return xmlPropertyList(more).value();
    }

    std::int32_t create(const std::string& queueID, const std::string& uri = kDevice,
                        const std::string& ppdText = driverlessPpdText(),
                        const PropertyDictionary& more = {}) {
        return printSystem_.createQueue(printSystem_.copyLocalServerURL().value(), queueID,
                                        attributes(uri, ppdText, more), kOptions);
    }

    TemporaryFolder folder_;
    PrivateScheduler scheduler_;
    UseScheduler use_{scheduler_};
    FakeLog log_;
    PlistPreferenceStore preferences_{folder_.path(), log_};
    CupsPrintSystem printSystem_{log_, preferences_};
};

TEST_F(CupsPrintSystemTest, MakesAnIdleQueueThatTakesJobs) {
    ASSERT_EQ(create("Laser", kDevice, driverlessPpdText(), {{"Location", "Caf\xC3\xA9"}}), 0)
        << testing::PrintToString(log_.lines());
    EXPECT_EQ(scheduler_.attribute("Laser", "device-uri"), kDevice);
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-info"), "Acme Laser (2nd floor)");
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-location"), "Caf\xC3\xA9");
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-state"), "3");
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-is-accepting-jobs"), "true");
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-make-and-model"), "Acme Laser, test");
    EXPECT_EQ(scheduler_.ppd("Laser"), driverlessPpdText());
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(CupsPrintSystemTest, MakesQueuesForEveryKindOfDevice) {
    EXPECT_EQ(create("A", "usb://Acme/Laser?serial=1"), 0);
    EXPECT_EQ(create("B", "ipps://printer.example/ipp/print"), 0);
    EXPECT_EQ(create("C", "ippusb://Acme%20Laser._ipp._tcp.local./?uuid=1"), 0);
    EXPECT_EQ(create("D", "mdns://some-uuid", scannerPpdText(), {{"Scanner", true}}), 0);
    EXPECT_EQ(create("E", "usb://some-uuid", scannerPpdText(), {{"Scanner", true}}), 0);
    EXPECT_EQ(create("F", "file:///dev/null", scannerPpdText(), {{"Scanner", true}}), 0);
    EXPECT_THAT(scheduler_.queues(), ElementsAre("A", "B", "C", "D", "E", "F"))
        << testing::PrintToString(log_.lines());
}

TEST_F(CupsPrintSystemTest, MakesQueuesWithUnusualNames) {
    for (const auto* name : {"B\xC3\xBCro", "what?", "a%20b", "q'uo&te", "-dash", "a+b"})
        EXPECT_EQ(create(name), 0) << name << testing::PrintToString(log_.lines());
    EXPECT_THAT(scheduler_.queues(),
                testing::UnorderedElementsAre("B\xC3\xBCro", "what?", "a%20b", "q'uo&te", "-dash", "a+b"));
    EXPECT_EQ(create(std::string(127, 'n')), 0);
}

TEST_F(CupsPrintSystemTest, NeverChangesAnExistingQueue) {
    scheduler_.addQueue("Laser", "ipp://other.example/ipp/print", driverlessPpdText());
    EXPECT_EQ(create("Laser"), PrintSystemStatus::kCannotCreate);
    EXPECT_EQ(create("LASER"), PrintSystemStatus::kCannotCreate);
    EXPECT_EQ(scheduler_.attribute("Laser", "device-uri"), "ipp://other.example/ipp/print");
    EXPECT_THAT(scheduler_.queues(), ElementsAre("Laser"));
    EXPECT_THAT(log_.lines(), testing::Each(HasSubstr("exists")));
}

struct RefusedPpd {
    const char* why;
    std::string text;
};
const RefusedPpd kRefusedPpds[] = {
    {"an empty file would make a raw queue", ""},
    {"random bytes", "\x01\x02\xff\xfe garbage"},
    {"plain text", "hello\n"},
    {"a filter of somebody else's", ppdWith("*cupsFilter: \"application/pdf 0 foomatic-rip\"\n")},
    {"a path out of the filters' folder",
     ppdWith("*cupsFilter2: \"image/urf image/urf 0 ../backend/usb\"\n")},
};

TEST_F(CupsPrintSystemTest, SendsNoBadPpdToTheScheduler) {
    for (const auto& [why, text] : kRefusedPpds)
        EXPECT_EQ(create("Laser", kDevice, text), PrintSystemStatus::kBadData) << why;
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
    EXPECT_THAT(log_.lines(), testing::SizeIs(std::size(kRefusedPpds)));
    EXPECT_THAT(log_.lines(), testing::Each(testing::AllOf(HasSubstr("\"Laser\""), HasSubstr(kDevice))));
}

TEST_F(CupsPrintSystemTest, LeavesNoQueueWhenTheSchedulerKnowsNoBackendForTheDevice) {
    EXPECT_EQ(create("Scanner", "bluetooth://some-uuid", scannerPpdText(), {{"Scanner", true}}),
              PrintSystemStatus::kCannotCreate);
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
    EXPECT_THAT(log_.lines(), ElementsAre(HasSubstr("Bad device-uri scheme")));
}

TEST_F(CupsPrintSystemTest, RefusesAnotherPrintServer) {
    EXPECT_EQ(printSystem_.createQueue("ipp://elsewhere.example/", "Laser",
                                       attributes(kDevice, driverlessPpdText()), kOptions),
              PrintSystemStatus::kBadData);
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
}

TEST_F(CupsPrintSystemTest, RemovesNoQueueButItsOwnFailures) {
    scheduler_.addQueue("Theirs", kDevice, driverlessPpdText());
    ASSERT_EQ(create("Mine"), 0);
    EXPECT_NE(printSystem_.removeQueue("Theirs"), 0);
    EXPECT_NE(printSystem_.removeQueue("Mine"), 0);
    EXPECT_NE(printSystem_.removeQueue("None"), 0);
    EXPECT_EQ(create("Theirs"), PrintSystemStatus::kCannotCreate);
    EXPECT_NE(printSystem_.removeQueue("Theirs"), 0) << "the creation that failed did not make this one";
    EXPECT_THAT(scheduler_.queues(), ElementsAre("Mine", "Theirs"));
}

TEST_F(CupsPrintSystemTest, SuggestsNamesThatTheSchedulerTakes) {
    EXPECT_EQ(printSystem_.suggestQueueName("Acme Laser/2", false), "Acme_Laser_2");
    EXPECT_EQ(printSystem_.suggestQueueName("Acme Laser/2", true), "Acme_Laser_2");
    EXPECT_EQ(printSystem_.suggestQueueName("", false), std::nullopt);
    EXPECT_EQ(printSystem_.suggestQueueName("", true), std::nullopt);
}

TEST_F(CupsPrintSystemTest, SuggestsUniqueNamesAmongAllDestinations) {
    scheduler_.addQueue("acme_laser", kDevice, driverlessPpdText());
    const auto program = runProgram({"lpadmin", "-p", "acme_laser", "-c", "Acme_Laser_2"},
                                    {.environment = scheduler_.environment()});
    ASSERT_EQ(program.exitStatus, 0) << program.standardError;
    EXPECT_EQ(printSystem_.suggestQueueName("Acme Laser", false), "Acme_Laser");
    EXPECT_EQ(printSystem_.suggestQueueName("Acme Laser", true), "Acme_Laser_3")
        << "the second one is a class";
}

TEST_F(CupsPrintSystemTest, LeavesAClassOfTheNameAlone) {
    scheduler_.addQueue("member", kDevice, driverlessPpdText());
    ASSERT_EQ(runProgram({"lpadmin", "-p", "member", "-c", "Both"}, {.environment = scheduler_.environment()})
                  .exitStatus,
              0);
    EXPECT_EQ(create("Both"), PrintSystemStatus::kCannotCreate);
    printSystem_.removeQueue("Both");
    EXPECT_THAT(scheduler_.queues(), ElementsAre("Both", "member"));
}

TEST_F(CupsPrintSystemTest, KnowsAFaxQueue) {
    const auto faxPpd = driverlessPpdText() + "*cupsFax: True\n";
    scheduler_.addQueue("TheirFax", kDevice, faxPpd);
    scheduler_.addQueue("Theirs", kDevice, driverlessPpdText());
    ASSERT_EQ(create("Fax", kDevice, faxPpd), 0);
    ASSERT_EQ(create("Laser"), 0);
    for (const auto* queue : {"Fax", "TheirFax"})
        EXPECT_TRUE(printSystem_.isFax(queue)) << queue;
    for (const auto* queue : {"Laser", "Theirs", "None"})
        EXPECT_FALSE(printSystem_.isFax(queue)) << queue;
}

TEST_F(CupsPrintSystemTest, KnowsAScannerQueue) {
    scheduler_.addQueue("TheirScanner", "usb://other-uuid", scannerPpdText());
    scheduler_.addQueue("Theirs", kDevice, driverlessPpdText());
    ASSERT_EQ(create("Scanner", "usb://some-uuid", scannerPpdText(), {{"Scanner", true}}), 0);
    ASSERT_EQ(create("Laser"), 0);
    for (const auto* queue : {"Scanner", "TheirScanner"})
        EXPECT_TRUE(printSystem_.isScanner(queue)) << queue;
    for (const auto* queue : {"Laser", "Theirs", "None"})
        EXPECT_FALSE(printSystem_.isScanner(queue)) << queue;
}

TEST_F(CupsPrintSystemTest, SeesThatAReplacedPpdMakesAnotherKindOfQueue) {
    ASSERT_EQ(create("Laser"), 0);
    EXPECT_FALSE(printSystem_.isFax("Laser"));
    ASSERT_EQ(printSystem_.setQueuePPD(
                  "Laser", folder_.write("new.ppd", driverlessPpdText() + "*cupsFax: True\n").string()),
              0);
    EXPECT_TRUE(printSystem_.isFax("Laser"));
}

TEST_F(CupsPrintSystemTest, MakesAQueueTheDefault) {
    ASSERT_EQ(create("Laser"), 0);
    EXPECT_EQ(printSystem_.setDefaultPrinter("Laser"), 0);
    EXPECT_EQ(runProgram({"lpstat", "-d"}, {.environment = scheduler_.environment()}).standardOutput,
              "system default destination: Laser\n");
    EXPECT_NE(printSystem_.setDefaultPrinter("None"), 0);
}

TEST_F(CupsPrintSystemTest, WantsTheNewestQueueAsDefaultWhileThereIsNone) {
    EXPECT_TRUE(printSystem_.useLastPrinterAsCurrentPrinter());
    ASSERT_EQ(create("Laser"), 0);
    EXPECT_TRUE(printSystem_.useLastPrinterAsCurrentPrinter());
    scheduler_.setDefault("Laser");
    EXPECT_FALSE(printSystem_.useLastPrinterAsCurrentPrinter());
}

TEST_F(CupsPrintSystemTest, WantsTheNewestQueueAsDefaultWhereTheUserDoes) {
    scheduler_.addQueue("Laser", kDevice, driverlessPpdText());
    scheduler_.setDefault("Laser");
    preferences_.setValue(CupsPrintSystem::kPreferenceDomain, CupsPrintSystem::kNewestIsDefault, true);
    EXPECT_TRUE(printSystem_.useLastPrinterAsCurrentPrinter());
    preferences_.setValue(CupsPrintSystem::kPreferenceDomain, CupsPrintSystem::kNewestIsDefault, false);
    EXPECT_FALSE(printSystem_.useLastPrinterAsCurrentPrinter());
}

TEST_F(CupsPrintSystemTest, CopiesAQueuesPpd) {
    ASSERT_EQ(create("Laser"), 0);
    const auto copy = printSystem_.copyQueuePPD("Laser");
    ASSERT_TRUE(copy);
    EXPECT_TRUE(std::filesystem::symlink_status(*copy).type() == std::filesystem::file_type::regular);
    EXPECT_EQ(readFile(*copy), driverlessPpdText());
    std::filesystem::remove(*copy);
    EXPECT_EQ(printSystem_.copyQueuePPD("None"), std::nullopt);
    scheduler_.addQueue("Raw", kDevice);
    EXPECT_EQ(printSystem_.copyQueuePPD("Raw"), std::nullopt);
}

TEST_F(CupsPrintSystemTest, ReplacesAQueuesPpdAndNothingElse) {
    ASSERT_EQ(create("Laser", kDevice, driverlessPpdText(), {{"Location", "Lab"}}), 0);
    const auto replacement = driverlessPpdText() + "*QLScannerUUID: \"u\"\n*QLICADriver: \"True\"\n\n";
    EXPECT_EQ(printSystem_.setQueuePPD("Laser", folder_.write("new.ppd", replacement).string()), 0)
        << testing::PrintToString(log_.lines());
    EXPECT_EQ(scheduler_.ppd("Laser"), replacement);
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-location"), "Lab");
    EXPECT_EQ(scheduler_.attribute("Laser", "printer-state"), "3");
}

TEST_F(CupsPrintSystemTest, KeepsTheOldPpdWhenTheNewOneIsBad) {
    ASSERT_EQ(create("Laser"), 0);
    for (const auto* text : {"", "*QLScannerUUID: \"u\"\n*QLICADriver: \"True\"\n\n"})
        EXPECT_EQ(printSystem_.setQueuePPD("Laser", folder_.write("new.ppd", text).string()),
                  PrintSystemStatus::kBadData)
            << text;
    const auto withFilter = driverlessPpdText() + "*cupsFilter: \"application/pdf 0 gstopxl\"\n";
    EXPECT_EQ(printSystem_.setQueuePPD("Laser", folder_.write("new.ppd", withFilter).string()),
              PrintSystemStatus::kBadData);
    EXPECT_NE(printSystem_.setQueuePPD("Laser", "/nonexistent.ppd"), 0);
    EXPECT_EQ(scheduler_.ppd("Laser"), driverlessPpdText());
}

TEST_F(CupsPrintSystemTest, MakesNoQueueBySettingAPpd) {
    EXPECT_NE(printSystem_.setQueuePPD("None", folder_.write("new.ppd", driverlessPpdText()).string()), 0);
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
}

TEST_F(CupsPrintSystemTest, FindsALocalizedPpdWhereTheFileIs) {
    const auto path = folder_.write("x.ppd", driverlessPpdText()).string();
    EXPECT_EQ(printSystem_.copyLocalizedPPD(path), path);
    EXPECT_EQ(printSystem_.copyLocalizedPPD("/nonexistent.ppd"), std::nullopt);
    EXPECT_EQ(printSystem_.copyLocalizedPPD(folder_.path().string()), std::nullopt);
}

TEST_F(CupsPrintSystemTest, MakesQueuesSideBySide) {
    std::vector<std::jthread> threads;
    std::atomic<int> failures = 0;
    const auto url = printSystem_.copyLocalServerURL().value();
    const auto list = attributes(kDevice, driverlessPpdText());
    const auto address = scheduler_.address();
    for (int i = 0; i < 8; ++i)
        threads.emplace_back([&, i] {
            if (printSystem_.createQueue(url, "Queue" + std::to_string(i), list, kOptions) != 0)
                ++failures;
        });
    threads.clear();
    EXPECT_EQ(failures, 0) << testing::PrintToString(log_.lines());
    EXPECT_EQ(scheduler_.queues().size(), 8U);
}

TEST(CupsPrintSystem, NamesTheServerOfTheUsersConfiguration) {
    FakeLog log;
    const PlistPreferenceStore preferences("/nonexistent", log);
    CupsPrintSystem printSystem(log, preferences);
    const UseScheduler use("printers.example:6310");
    EXPECT_EQ(printSystem.copyLocalServerURL(), "ipp://printers.example:6310/");
}

/// A print system whose scheduler is not what it should be.
struct Troubled {
    TemporaryFolder folder;
    FakeLog log;
    PlistPreferenceStore preferences{folder.path(), log};
    CupsPrintSystem printSystem{log, preferences};

    std::int32_t create() {
        const PropertyDictionary attributes{
            {"Printer URI", kDevice},
            {"com.quillon.print.PrinterInfo.PPD", folder.write("driver.ppd", driverlessPpdText()).string()}};
        return printSystem.createQueue(printSystem.copyLocalServerURL().value(), "Laser",
                                       xmlPropertyList(attributes).value(), kOptions);
    }
};

TEST(CupsPrintSystem, IsUnavailableWithoutAScheduler) {
    const UseScheduler use("/nonexistent/cups.sock");
    Troubled troubled;
    EXPECT_EQ(troubled.create(), PrintSystemStatus::kUnavailable);
    EXPECT_EQ(troubled.printSystem.suggestQueueName("Laser", true), std::nullopt);
    EXPECT_EQ(troubled.printSystem.suggestQueueName("Laser", false), "Laser");
    EXPECT_EQ(troubled.printSystem.setDefaultPrinter("Laser"), PrintSystemStatus::kUnavailable);
    EXPECT_FALSE(troubled.printSystem.useLastPrinterAsCurrentPrinter());
    EXPECT_FALSE(troubled.printSystem.isFax("Laser"));
    EXPECT_EQ(troubled.log.lines().size(), 5U) << testing::PrintToString(troubled.log.lines());
}

TEST(CupsPrintSystem, HasNoPermissionWhereTheSchedulerSaysSo) {
    PrivateScheduler scheduler({.policy = SchedulerPolicy::stock, .listensOnTcp = true});
    const UseScheduler use(scheduler);
    Troubled troubled;
    EXPECT_EQ(troubled.create(), PrintSystemStatus::kNoPermission)
        << testing::PrintToString(troubled.log.lines());
    EXPECT_THAT(scheduler.queues(), IsEmpty());
}

TEST(CupsPrintSystem, LeavesNothingWhereAdditionsAreRefused) {
    PrivateScheduler scheduler({.policy = SchedulerPolicy::refusesAdditions});
    const UseScheduler use(scheduler);
    Troubled troubled;
    EXPECT_EQ(troubled.create(), PrintSystemStatus::kNoPermission);
    EXPECT_THAT(scheduler.queues(), IsEmpty());
    EXPECT_THAT(troubled.log.lines(), ElementsAre(HasSubstr(kDevice)));
}

TEST(CupsPrintSystem, GoesOnAfterTheSchedulerWasRestarted) {
    PrivateScheduler scheduler;
    const UseScheduler use(scheduler);
    Troubled troubled;
    scheduler.stop();
    EXPECT_EQ(troubled.create(), PrintSystemStatus::kUnavailable);
    scheduler.start();
    EXPECT_EQ(troubled.create(), 0) << testing::PrintToString(troubled.log.lines());
}

}  // namespace
}  // namespace ventras
