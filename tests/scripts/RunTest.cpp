#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <optional>
#include <string>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/StockUsbBackend.h"
#include "tests/parts/UsbBench.h"
#include "tests/parts/VirtualPrinter.h"
#include "tests/scripts/ScriptsFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

bool contains(const std::string& text, std::string_view part) {
    return text.find(part) != std::string::npos;
}

std::string story(const ProgramResult& result) {
    return "exit status " + std::to_string(result.exitStatus) + "\n" + result.standardOutput +
           result.standardError;
}

pid_t schedulerOf(const fs::path& folder) {
    const auto text = readFile(folder / "cupsd.pid");
    return text.empty() ? 0 : std::stoi(text);
}

/// A process that has ended has no command line, even while nobody has taken notice of its end.
bool runs(pid_t process) {
    return process > 0 && !readFile("/proc/" + std::to_string(process) + "/cmdline").empty();
}

/// A scheduler keeps its files as long as it runs.
void end(pid_t scheduler) {
    kill(scheduler, SIGTERM);
    EXPECT_TRUE(comesTrue([&] { return !runs(scheduler); }, std::chrono::seconds(20)));
}

class RunInOwnFolder : public testing::Test {
protected:
    explicit RunInOwnFolder(std::optional<uid_t> user = {}) : folder_(user) {}
    // The scheduler that a script leaves serving is not the test's child, and would outlive it.
    ~RunInOwnFolder() override {
        if (const auto scheduler = schedulerOf(kept()); runs(scheduler))
            end(scheduler);
    }

    fs::path kept() const { return folder_.home() / "state/ventrasagent/cups"; }
    fs::path demonstration() const { return folder_.home() / "state/ventrasagent/demo"; }

    ScriptsFolder folder_;
};

class RunScript : public RunInOwnFolder, public testing::WithParamInterface<bool> {
protected:
    RunScript() : RunInOwnFolder(GetParam() ? ordinaryUser() : std::nullopt) {}
};

INSTANTIATE_TEST_SUITE_P(As, RunScript, testing::Bool(),
                         [](const auto& test) { return test.param ? "OrdinaryUser" : "Administrator"; });

TEST_P(RunScript, DemonstratesAPageThatComesOut) {
    const auto result = folder_.run("scripts/run");
    ASSERT_EQ(result.exitStatus, 0) << story(result);
    const auto page = demonstration() / "printer/pages/1-page.urf";
    EXPECT_TRUE(contains(result.standardOutput, page.string() + " (")) << story(result);
    EXPECT_TRUE(readFile(page).starts_with("UNIRAST")) << story(result);
}

TEST_P(RunScript, EndsWhatItStartedForTheDemonstration) {
    ASSERT_EQ(folder_.run("scripts/run").exitStatus, 0);
    const auto scheduler = schedulerOf(demonstration() / "cups");
    EXPECT_GT(scheduler, 0);
    EXPECT_FALSE(runs(scheduler));
    EXPECT_EQ(readFile(demonstration() / "cups/etc/printers.conf").find("<Printer"), std::string::npos);
}

TEST_P(RunScript, DemonstratesAnew) {
    ASSERT_EQ(folder_.run("scripts/run").exitStatus, 0);
    const auto again = folder_.run("scripts/run");
    EXPECT_EQ(again.exitStatus, 0) << story(again);
}

TEST_P(RunScript, SaysWhenNothingComesOut) {
    folder_.replaceCommand("lp", "echo 'lp: out of order' >&2; exit 1");
    const auto result = folder_.run("scripts/run");
    EXPECT_NE(result.exitStatus, 0);
    EXPECT_TRUE(contains(result.standardError, "out of order")) << story(result);
    EXPECT_FALSE(runs(schedulerOf(demonstration() / "cups")));
}

TEST_P(RunScript, LeavesASchedulerServingWhereNoneWas) {
    const VirtualPrinter printer;
    const auto result = folder_.run("scripts/run", {printer.uri()});
    ASSERT_EQ(result.exitStatus, 0) << story(result);
    EXPECT_TRUE(contains(result.standardOutput, "Queue ID:")) << story(result);
    EXPECT_TRUE(contains(result.standardError, "export CUPS_SERVER=" + (kept() / "cups.sock").string()))
        << story(result);
    EXPECT_TRUE(runs(schedulerOf(kept())));
}

TEST_P(RunScript, UsesItsSchedulerTheNextTime) {
    const VirtualPrinter printer;
    ASSERT_EQ(folder_.run("scripts/run", {printer.uri()}).exitStatus, 0);
    const auto scheduler = schedulerOf(kept());
    const auto again = folder_.run("scripts/run", {printer.uri()});
    EXPECT_EQ(again.exitStatus, 0) << story(again);
    EXPECT_FALSE(contains(again.standardOutput, "Queue ID:")) << "the queue is there already\n"
                                                              << story(again);
    EXPECT_EQ(schedulerOf(kept()), scheduler);
}

TEST_P(RunScript, FindsAShorterPlaceForASocketThatNobodyCouldReach) {
    const auto far = folder_.home() / std::string(100, 'x');
    folder_.setVariable("XDG_STATE_HOME", far);
    const VirtualPrinter printer;
    const auto result = folder_.run("scripts/run", {printer.uri()});
    EXPECT_EQ(result.exitStatus, 0) << story(result);
    const auto scheduler = schedulerOf(far / "ventrasagent/cups");
    ASSERT_TRUE(runs(scheduler)) << story(result);
    const auto folder = fs::read_symlink(far / "ventrasagent/cups/socket-folder");
    end(scheduler);
    fs::remove_all(folder);
}

TEST_P(RunScript, UsesTheSchedulerThatAnswers) {
    const PrivateScheduler scheduler({.user = GetParam() ? ordinaryUser() : std::nullopt});
    for (const auto& [name, value] : scheduler.environment())
        folder_.setVariable(name, value);
    const VirtualPrinter printer;
    const auto result = folder_.run("scripts/run", {printer.uri()});
    EXPECT_EQ(result.exitStatus, 0) << story(result);
    EXPECT_EQ(scheduler.queues().size(), 1U) << story(result);
    EXPECT_FALSE(fs::exists(kept()));
}

TEST_P(RunScript, HasTheAgentsBackendInFrontOfTheStockOne) {
    const VirtualPrinter printer;
    ASSERT_EQ(folder_.run("scripts/run", {printer.uri()}).exitStatus, 0);
    EXPECT_EQ(readFile(kept() / "bin/backend/usb"), readFile(fs::path(VENTRAS_BUILD) / "bin/usb"));
    EXPECT_EQ(readFile(kept() / "bin/daemon/stock-usb"), readFile(stockUsbBackend()));
}

TEST_P(RunScript, PassesOnAndExplainsTheAgentsStatus) {
    const auto result = folder_.run("scripts/run", {"ipp://127.0.0.1:9/ipp/print"});
    EXPECT_EQ(result.exitStatus, 255) << story(result);
    EXPECT_TRUE(contains(result.standardError, "ended with 255: no device was found")) << story(result);
}

using RunScriptWithUsb = RunInOwnFolder;

TEST_F(RunScriptWithUsb, MakesAQueueForAUsbPrinterWithAnInstalledDriver) {
    UsbBench bench;
    bench.plugIn("1-4", {.deviceID = "MFG:Brother;CMD:PJL,HBP;MDL:DCP-7030;SN:B7;"});
    for (const auto& [name, value] : bench.environment())
        folder_.setVariable(name, value);
    const auto result = folder_.run("scripts/run", {"-u20971520,0"});
    ASSERT_EQ(result.exitStatus, 0) << story(result);
    const auto queue = result.standardOutput.find("Queue ID:");
    ASSERT_NE(queue, std::string::npos) << story(result);
    const auto name =
        result.standardOutput.substr(queue + 9, result.standardOutput.find('\n', queue) - queue - 9);
    EXPECT_TRUE(contains(readFile(kept() / "etc/ppd" / (name + ".ppd")), "rastertobrlaser")) << story(result);
}

}  // namespace
}  // namespace ventras
