#include "download/DownloadTriggerOperation.h"

#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "queues/OperationDelegate.h"
#include "tests/devices/FakeDevice.h"
#include "tests/fakes/FakePlatform.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

using Predicate = std::optional<std::string>;

const std::string kSoftwareKind = "((\"printing software\" in tags ) OR (\"printer update\" in tags ))";

TEST(UpdatePredicate, NamesEveryDeviceInOrder) {
    struct Case {
        std::vector<std::string> scanIDs;
        std::string devices;
    };
    const std::vector<Case> cases{
        {{"A"}, "(\"A\" IN tags)"},
        {{"A", "B"}, "((\"A\" IN tags) OR (\"B\" IN tags))"},
        {{"B", "A"}, "((\"B\" IN tags) OR (\"A\" IN tags))"},
        {{"A", "A"}, "((\"A\" IN tags) OR (\"A\" IN tags))"},
        {{"A", "B", "C"}, "((\"A\" IN tags) OR (\"B\" IN tags) OR (\"C\" IN tags))"},
        {{"", "A", ""}, "(\"A\" IN tags)"},
        {{"A", "", "B"}, "((\"A\" IN tags) OR (\"B\" IN tags))"},
        {{"MANUFACTURER:HP;MODEL:LaserJet 4"}, "(\"MANUFACTURER:HP;MODEL:LaserJet 4\" IN tags)"},
        {{"MANUFACTURER:印刷;MODEL:%@"}, "(\"MANUFACTURER:印刷;MODEL:%@\" IN tags)"},
    };
    for (const auto& [scanIDs, devices] : cases)
        EXPECT_EQ(DownloadTriggerOperation::predicateForUpdateStrings(scanIDs),
                  kSoftwareKind + " AND " + devices)
            << devices;
}

TEST(UpdatePredicate, TakesAQuotationMarkAsItStands) {
    EXPECT_EQ(DownloadTriggerOperation::predicateForUpdateString("A\" IN tags) OR (\"B"),
              kSoftwareKind + " AND (\"A\" IN tags) OR (\"B\" IN tags)");
}

TEST(UpdatePredicate, IsAbsentWithoutANonEmptyID) {
    for (const auto& scanIDs : std::vector<std::vector<std::string>>{{}, {""}, {"", ""}})
        EXPECT_EQ(DownloadTriggerOperation::predicateForUpdateStrings(scanIDs), std::nullopt)
            << scanIDs.size();
    EXPECT_EQ(DownloadTriggerOperation::predicateForUpdateString(""), std::nullopt);
}

TEST(UpdatePredicate, OfOneIDIsTheSameInBothForms) {
    const std::vector<std::string> scanIDs{"MANUFACTURER:HP;MODEL:LaserJet 4"};
    EXPECT_EQ(DownloadTriggerOperation::predicateForUpdateString(scanIDs.front()),
              DownloadTriggerOperation::predicateForUpdateStrings(scanIDs));
}

// Notes on which thread it heard of which operation, slowly.
class SlowRecorder final : public OperationDelegate {
public:
    void operationCompleted(Operation& operation) override {
        thread = std::this_thread::get_id();
        std::this_thread::sleep_for(50ms);
        finished = &operation;
    }

    std::thread::id thread;
    Operation* finished = nullptr;
};

TEST(DownloadTrigger, ReportsOnTheMainThreadAndWaitsUntilThatIsHandled) {
    FakePlatform fake;
    SlowRecorder delegate;
    const auto operation =
        DownloadTriggerOperation::downloadTriggerOperationWithDelegate(delegate, fake.platform);
    Operation* finishedBefore = nullptr;
    const std::jthread worker([&] {
        operation->main();
        finishedBefore = delegate.finished;
        fake.runLoop.stop();
    });
    fake.runLoop.runUntil(Deadline::after(20s));
    EXPECT_EQ(finishedBefore, operation.get());
    EXPECT_EQ(delegate.thread, std::this_thread::get_id());
}

TEST(DownloadTrigger, KeepsItsPrintersInTheOrderInWhichTheyAreAdded) {
    FakePlatform fake;
    SlowRecorder delegate;
    DownloadTriggerOperation operation(delegate, fake.platform);
    EXPECT_EQ(operation.printers().size(), 0U);
    const std::vector<DevicePtr> devices{std::make_shared<FakeDevice>(), std::make_shared<FakeDevice>()};
    operation.addPrinterForSoftwareUpdate(devices[0]);
    operation.addPrinterForSoftwareUpdate(devices[1]);
    EXPECT_EQ(operation.printers(), devices);
    operation.setPrinters({devices[1]});
    EXPECT_EQ(operation.printers(), std::vector{devices[1]});
}

}  // namespace
}  // namespace ventras
