#include "agent/VentrasController.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "download/DownloadTriggerOperation.h"
#include "queues/VentraOperation.h"
#include "tests/agent-unit/Round.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/queues/LostGenericDriver.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

// What the process, and then the shell, sees of an exit status.
std::int32_t ofProcess(std::uint64_t status) {
    return static_cast<std::int32_t>(status & 0xFFFFFFFF);
}

TEST_F(Round, IsNotStartedWithoutADevice) {
    for (const Arguments& arguments : std::vector<Arguments>{
             {}, {"-d"}, {"--download"}, {"--skerrow"}, {"nonsense"}, {""}, {"-u1,0"}, {"-snonsense"}}) {
        EXPECT_EQ(run(arguments), -1) << (arguments.empty() ? "none" : arguments[0]);
        EXPECT_EQ(fake_.imageDevices.browsers, 0) << (arguments.empty() ? "none" : arguments[0]);
    }
    EXPECT_FALSE(controller_.done());
    EXPECT_EQ(controller_.exitStatus(), 0U);
}

TEST_F(Round, MakesAQueueForANetworkPrinter) {
    const ScriptedPrinter printer;
    EXPECT_EQ(run({printer.uri()}), 0);
    EXPECT_EQ(controller_.exitStatus(), 0U);
    ASSERT_EQ(fake_.printSystem.creations.size(), 1U);
    EXPECT_EQ(fake_.printSystem.creations[0].queueID, "Scripted");
    EXPECT_EQ(output_, "INFO:Determining printer's features...\nQueue ID:Scripted\n");
    EXPECT_EQ(errors_, "");
}

TEST_F(Round, TakesEqualURIsForOneDeviceAndOthersForSeveral) {
    const ScriptedPrinter printer;
    EXPECT_EQ(run({printer.uri(), printer.uri()}), 0);
    EXPECT_EQ(fake_.printSystem.creations.size(), 1U);
}

TEST_F(Round, TakesURIsThatDifferInTheirSchemeForTwoDevices) {
    const ScriptedPrinter printer;
    EXPECT_EQ(run({printer.uri("ipp"), printer.uri("ipps")}), 0);
    EXPECT_EQ(fake_.printSystem.creations.size(), 2U);
}

TEST_F(Round, SaysOnceForEachOldOptionThatItIsOne) {
    const ScriptedPrinter printer;
    EXPECT_EQ(run({"-b", "-d", printer.uri(), "-tx"}), 0);
    const std::string message = "Deprecated or unsupports options...\n";
    EXPECT_EQ(errors_, message + message + message);
}

TEST_F(Round, StartsOneDeviceBrowserForScannersAndMultifunctionDevices) {
    const ScriptedPrinter printer;
    EXPECT_EQ(run({printer.uri()}), 0);
    EXPECT_EQ(fake_.imageDevices.browsers, 1);
    EXPECT_EQ(fake_.imageDevices.started, 1);
    EXPECT_EQ(fake_.imageDevices.mask, 258U);
}

TEST_F(Round, LooksForMoreKindsOfScannersBesideAnIppUsbPrinter) {
    EXPECT_EQ(run({"ippusb://No Such Printer"}), 0);
    EXPECT_EQ(fake_.imageDevices.mask, 258U | 0xfe00U);
    EXPECT_EQ(fake_.imageDevices.started, 1);
}

TEST_F(Round, IsAllRightWhenAllDevicesHaveQueues) {
    const ScriptedPrinter one, two;
    addQueue("first", one.uri());
    addQueue("second", two.uri());
    addQueue("third", usbURI("Winjet"));
    EXPECT_EQ(run({one.uri(), two.uri(), attach(0x01100000, "Winjet")}), 0);
    EXPECT_EQ(controller_.exitStatus(), 0U);
    EXPECT_EQ(fake_.printSystem.creations.size(), 0U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 0U);
}

TEST_F(Round, EndsWithTheStatusOfAFailureSignExtended) {
    const ScriptedPrinter printer;
    fake_.printSystem.suggestsNames = false;
    EXPECT_EQ(run({printer.uri()}), 0);
    EXPECT_EQ(controller_.exitStatus(), static_cast<std::uint64_t>(-620));
    EXPECT_EQ(ofProcess(controller_.exitStatus()), -620);
}

TEST_F(Round, EndsWith255ForAPrinterThatCannotBeHandled) {
    const ScriptedPrinter printer({.edit = [](ipp_t* answer) { removeAttribute(answer, "urf-supported"); }});
    EXPECT_EQ(run({printer.uri()}), 0);
    EXPECT_EQ(controller_.exitStatus(), 255U);
}

TEST_F(Round, KeepsTheStatusOfAFailureThroughLaterSuccesses) {
    const ScriptedPrinter failing({.edit = [](ipp_t* answer) { removeAttribute(answer, "urf-supported"); }});
    const ScriptedPrinter slow({.delay = 300ms});
    EXPECT_EQ(run({failing.uri(), slow.uri()}), 0);
    EXPECT_EQ(controller_.exitStatus(), 255U);
    EXPECT_EQ(fake_.printSystem.creations.size(), 1U);
}

TEST_F(Round, EndsWithTheFailureThatIsReportedLast) {
    for (const bool unhandledIsLast : {true, false}) {
        const ScriptedPrinter unhandled(
            {.edit = [](ipp_t* answer) { removeAttribute(answer, "urf-supported"); },
             .delay = unhandledIsLast ? 400ms : 0ms});
        const ScriptedPrinter refused({.delay = unhandledIsLast ? 0ms : 400ms});
        fake_.printSystem.create = [](const auto&) { return 73; };
        VentrasController controller(fake_.platform, drivers_);
        testing::internal::CaptureStdout();
        const auto result = controller.run(Arguments{unhandled.uri(), refused.uri()});
        fake_.runLoop.runUntil(Deadline::after(20s));
        testing::internal::GetCapturedStdout();
        EXPECT_EQ(result, 0);
        EXPECT_EQ(controller.exitStatus(), unhandledIsLast ? 255U : 73U);
    }
}

TEST_F(Round, EndsWith241WhenDriversMayNotBeDownloaded) {
    offerPackages("Winjet", 1);
    EXPECT_EQ(run({attach(0x01100000, "Winjet"), "--download"}), 0);
    EXPECT_EQ(controller_.exitStatus(), 241U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 0U);
    EXPECT_EQ(fake_.preferences.settings.size(), 0U);
    EXPECT_EQ(errors_, "");
}

TEST_F(Round, LetsDriversBeDownloadedInSpiteOfTheOldOption) {
    EXPECT_EQ(run({attach(0x01100000, "Winjet"), "-d"}), 0);
    EXPECT_EQ(controller_.exitStatus(), 1U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 1U);
}

TEST_F(Round, TakesADriverlessPrinterWithoutADriverForSeen) {
    const LostGenericDriver lost(fake_, drivers_);
    const ScriptedPrinter printer;
    EXPECT_EQ(run({printer.uri()}), 0);
    EXPECT_EQ(failuresOf(printer.uri()), 1);
    EXPECT_EQ(controller_.exitStatus(), 0U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 0U);
    EXPECT_EQ(fake_.preferences.settings.size(), 0U);
}

TEST_F(Round, ServesManyPrintersThatAreSlowToAnswerAtOnce) {
    constexpr int kPrinters = 30;
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    Arguments arguments;
    for (int i = 0; i < kPrinters; ++i) {
        printers.push_back(std::make_unique<ScriptedPrinter>(ScriptedPrinterOptions{.delay = 1000ms}));
        arguments.push_back(printers.back()->uri());
    }
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(run(arguments), 0);
    EXPECT_LT(std::chrono::steady_clock::now() - start, 10s);  // one after the other they take 30 s
    EXPECT_EQ(fake_.printSystem.creations.size(), static_cast<std::size_t>(kPrinters));
    EXPECT_EQ(controller_.exitStatus(), 0U);
}

TEST_F(Round, EndsTheRunLoopsSliceAtOnce) {
    const ScriptedPrinter printer;
    testing::internal::CaptureStdout();
    ASSERT_EQ(controller_.run(Arguments{printer.uri()}), 0);
    const auto start = std::chrono::steady_clock::now();
    fake_.runLoop.runUntil(Deadline::after(60s));
    testing::internal::GetCapturedStdout();
    EXPECT_TRUE(controller_.done());
    EXPECT_LT(std::chrono::steady_clock::now() - start, 30s);
}

TEST_F(Round, RecordsThatAnOperationHadNoDevice) {
    VentraOperation operation(controller_, nullptr, fake_.platform, drivers_);
    controller_.operationCompleted(operation);
    EXPECT_EQ(controller_.exitStatus(), ~std::uint64_t{0});
    EXPECT_FALSE(controller_.done());
}

TEST_F(Round, IgnoresReportsOfOtherOperations) {
    class Other final : public Operation {
    public:
        void main() override {}
    } other;
    controller_.operationCompleted(other);
    EXPECT_EQ(controller_.exitStatus(), 0U);
    EXPECT_FALSE(controller_.done());
}

TEST_F(Round, EndsWithTheStatusThatItIsEndedWith) {
    for (const std::int64_t status : {0LL, 1LL, -1LL, -128LL, 0x1234567890LL}) {
        VentrasController controller(fake_.platform, drivers_);
        controller.terminateApplication(status);
        EXPECT_TRUE(controller.done());
        EXPECT_EQ(controller.exitStatus(), static_cast<std::uint64_t>(status));
    }
}

}  // namespace
}  // namespace ventras
