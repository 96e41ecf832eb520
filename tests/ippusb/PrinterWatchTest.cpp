#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <string>
#include <thread>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

// Stands where the agent stands and notes each run.
constexpr std::string_view kAgent = R"(#!/bin/sh
echo "$*" >> "${0%/*}/runs"
)";

class PrinterWatch : public testing::Test {
protected:
    PrinterWatch() {
        std::filesystem::permissions(folder_.write("agent", kAgent), std::filesystem::perms{0755});
        writeRuns("");
    }

    void writeRuns(std::string_view text) { folder_.write("runs", text); }

    std::vector<std::string> command() const { return {VENTRAS_WATCH, folder_ / "agent", "--download"}; }

    // As the daemon for IPP over USB registers a printer.
    void plugIn(const std::string& name, std::uint16_t port) {
        responder_.publish({.name = name, .port = port});
        responder_.publish({.name = std::to_string(port), .port = port, .type = "_ipp-usb._tcp"});
    }

    // Waits for so many runs, and a little longer for more than that.
    std::string runs(std::ptrdiff_t count) const {
        const auto text = [this] { return readFile(folder_ / "runs"); };
        comesTrue([&] { return std::ranges::count(text(), '\n') >= count; }, 10s);
        std::this_thread::sleep_for(200ms);
        return text();
    }

    TemporaryFolder folder_;
    PrivateResponder responder_;
};

TEST_F(PrinterWatch, RunsTheAgentForAPrinterThatAppears) {
    const RunningProgram watch(command());
    plugIn("Laser 9 (USB)", 60000);
    EXPECT_EQ(runs(1), "--download ippusb://Laser 9 (USB)\n") << watch.standardError();
}

TEST_F(PrinterWatch, RunsTheAgentForPrintersThatAreThereAlready) {
    plugIn("A \"B\" $(C)/D", 60000);
    const RunningProgram watch(command());
    EXPECT_EQ(runs(1), "--download ippusb://A \"B\" $(C)/D\n") << watch.standardError();
}

TEST_F(PrinterWatch, RunsTheAgentAgainWhenAPrinterComesBack) {
    const RunningProgram watch(command());
    plugIn("Laser", 60000);
    EXPECT_EQ(runs(1), "--download ippusb://Laser\n");
    responder_.withdrawAll();
    std::this_thread::sleep_for(2s);  // the rest of the records' life
    plugIn("Laser", 60000);
    EXPECT_EQ(runs(2), "--download ippusb://Laser\n--download ippusb://Laser\n") << watch.standardError();
}

TEST_F(PrinterWatch, PassesOverIppServicesThatAreNotOnTheUsb) {
    const RunningProgram watch(command());
    responder_.publish({.name = "Shared queue", .port = 631});
    plugIn("Laser", 60000);
    EXPECT_EQ(runs(1), "--download ippusb://Laser\n") << watch.standardError();
}

TEST_F(PrinterWatch, EndsWhenTheResponderDoes) {
    RunningProgram watch(command());
    plugIn("Laser", 60000);
    runs(1);
    responder_.kill();
    ASSERT_TRUE(watch.waitUntilEnded(5s));
    EXPECT_EQ(watch.result().exitStatus, 1);
    EXPECT_TRUE(watch.standardError().starts_with("No longer watching for printers: "))
        << watch.standardError();
}

TEST_F(PrinterWatch, GoesOnWhenThereIsNoAgent) {
    RunningProgram watch({VENTRAS_WATCH, folder_ / "missing"});
    plugIn("Laser", 60000);
    std::this_thread::sleep_for(1s);
    EXPECT_TRUE(watch.isRunning());
    EXPECT_NE(watch.standardError().find("No such file"), std::string::npos) << watch.standardError();
}

TEST_F(PrinterWatch, WantsToKnowWhatToRun) {
    EXPECT_EQ(runProgram({VENTRAS_WATCH}).exitStatus, 2);
}

}  // namespace
}  // namespace ventras
