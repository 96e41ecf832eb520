#include "queues/VentraOperation.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDManager.h"
#include "platform/OperationQueue.h"
#include "queues/OperationDelegate.h"
#include "tests/devices/FakeDevice.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/queues/OwnTemporaryFiles.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const DeviceDescription kDriverless{{"display-name", "Office"}, {"URF", "W8"}, {"pdl", "image/urf"}};

// Keeps what it hears, and stops the run loop after so many reports.
class Recorder final : public OperationDelegate {
public:
    Recorder(RunLoop& runLoop, std::size_t expected) : runLoop_(runLoop), expected_(expected) {}

    void operationCompleted(Operation& operation) override {
        threads.push_back(std::this_thread::get_id());
        statuses.push_back(dynamic_cast<VentraOperation&>(operation).status());
        if (statuses.size() == expected_)
            runLoop_.stop();
    }

    std::vector<std::thread::id> threads;
    std::vector<std::int32_t> statuses;

private:
    RunLoop& runLoop_;
    std::size_t expected_;
};

class QueueOperation : public testing::Test {
protected:
    std::shared_ptr<VellumProfilePrinterObject> driverless(const std::string& uri = "ipp://printer.local/") {
        auto printer =
            VellumProfilePrinterObject::initVellumProfilePrinterObjectWithURI(fake_.platform, drivers_, uri);
        printer->setAttributes(kDriverless);
        return printer;
    }

    // Runs operations for the devices on workers, and the run loop until all have reported.
    Recorder run(const std::vector<DevicePtr>& devices) {
        Recorder recorder(fake_.runLoop, devices.size());
        testing::internal::CaptureStdout();
        {
            OperationQueue queue;
            for (const auto& device : devices)
                queue.addOperation(
                    VentraOperation::operationWithDelegate(recorder, device, fake_.platform, drivers_));
            fake_.runLoop.runUntil(Deadline::after(20s));
        }
        testing::internal::GetCapturedStdout();
        return recorder;
    }

    OwnTemporaryFiles files_;
    UseScheduler use_{(files_.folder() / "nobody").string()};
    FakePlatform fake_;
    PPDManager drivers_{fake_.platform};
};

TEST_F(QueueOperation, HasNoStatusOfItsOwnUntilItHasRun) {
    Recorder recorder(fake_.runLoop, 1);
    const auto printer = driverless();
    const auto operation =
        VentraOperation::operationWithDelegate(recorder, printer, fake_.platform, drivers_);
    EXPECT_EQ(operation->status(), -1);
    EXPECT_EQ(operation->printer(), printer);
    EXPECT_EQ(recorder.statuses.size(), 0U);
}

TEST_F(QueueOperation, ReportsItsStatusOnTheMainThread) {
    const auto recorder = run({driverless()});
    EXPECT_EQ(recorder.statuses, std::vector{0});
    EXPECT_EQ(recorder.threads, std::vector{std::this_thread::get_id()});
    EXPECT_EQ(fake_.log.lines(), std::vector<std::string>{});
}

TEST_F(QueueOperation, ReportsWithoutADeviceToo) {
    EXPECT_EQ(run({nullptr}).statuses, std::vector{-1});
    EXPECT_EQ(fake_.log.lines(), std::vector<std::string>{});
}

TEST_F(QueueOperation, DoesNotLetItsWorkerGoOnBeforeTheReportIsHandled) {
    class SlowDelegate final : public OperationDelegate {
    public:
        void operationCompleted(Operation&) override {
            std::this_thread::sleep_for(50ms);
            handled = true;
        }
        bool handled = false;
    } delegate;
    VentraOperation operation(delegate, nullptr, fake_.platform, drivers_);
    bool wasHandled = false;
    const std::jthread worker([&] {
        operation.main();
        wasHandled = delegate.handled;
        fake_.runLoop.stop();
    });
    fake_.runLoop.runUntil(Deadline::after(20s));
    EXPECT_TRUE(wasHandled);
}

TEST_F(QueueOperation, SaysInTheLogWhyADeviceGetsNoQueue) {
    fake_.printSystem.create = [](const auto&) { return PrintSystemStatus::kNoPermission; };
    EXPECT_EQ(run({driverless("ipp://printer.local/")}).statuses, std::vector{77});
    EXPECT_EQ(fake_.log.lines(),
              std::vector<std::string>{
                  "No queue for ipp://printer.local/: the print scheduler does not let this user "
                  "make queues (77)"});
}

TEST_F(QueueOperation, SaysInTheLogWhatTheDeviceLacks) {
    const auto printer = driverless();
    printer->setAttributes({{"display-name", "Office"}});
    EXPECT_EQ(run({printer}).statuses, std::vector{255});
    ASSERT_EQ(fake_.log.lines().size(), 1U);
    const auto line = fake_.log.lines().front();
    EXPECT_TRUE(line.starts_with("No queue for ipp://printer.local/: ") && line.ends_with(" (255)")) << line;
    EXPECT_NE(line.find("image/urf"), std::string::npos) << line;
}

TEST_F(QueueOperation, NamesADeviceInTheLogThatHasNoURI) {
    EXPECT_EQ(run({std::make_shared<FakeDevice>("a thing", std::nullopt, "")}).statuses, std::vector{255});
    EXPECT_EQ(fake_.log.lines(),
              std::vector<std::string>{"No queue for a thing: it is of no kind that can be set up (255)"});
}

TEST_F(QueueOperation, GivesDevicesOfOneNameQueuesOfTheirOwnWhenRunAtOnce) {
    std::vector<DevicePtr> devices;
    for (int i = 0; i < 20; ++i)
        devices.push_back(driverless("ipp://printer.local/" + std::to_string(i)));
    EXPECT_EQ(run(devices).statuses, std::vector(20, 0));
    std::set<std::string> queues;
    for (const auto& device : devices)
        queues.insert(device->queueID().value_or("-"));
    EXPECT_EQ(queues.size(), devices.size());
    EXPECT_EQ(files_.left(), std::vector<std::string>{});
}

}  // namespace
}  // namespace ventras
