#include <gmock/gmock.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "tests/agent/Agent.h"
#include "tests/ctl/Ctl.h"
#include "tests/kernel/VhciPort.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/StockUsbBackend.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::IsEmpty;
using Names = std::vector<std::string>;

constexpr const char* kLocation = "-u17825792,0";  // 1-1
constexpr const char* kPclID = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;";
// An emulated processor is slow.
constexpr auto kLimit = 90s;

TEST(KernelHotplug, StartsTheAgentForThePrinterInterfacesOfADevice) {
    const VhciPort other({}, 2);
    const VhciPort port(
        {.settings = {{0, 0, 7, 1, 2}, {1, 0, 0xFF, 0, 0}, {2, 0, 0xFF, 0, 0}, {2, 1, 7, 1, 4}}});
    const auto run = runProgram({VENTRAS_HOTPLUG_PROGRAM, port.systemPath(), "/bin/echo", "--skerrow"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, "--skerrow -u17825792,0 -u17825792,2\n");
}

TEST(KernelCtl, ListsThePrinterInterfacesThatAreAttached) {
    const VhciPort port({.vendor = 1008, .product = 7, .deviceID = kPclID});
    const auto listed = ctl({"usb", "--json"});
    EXPECT_EQ(listed.exitStatus, 0) << listed.standardError;
    EXPECT_EQ(listed.standardOutput,
              R"([{"location":17825792,"interfaceNumber":0,"vendorID":1008,"productID":7,)"
              R"("deviceID":"MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;","listIPPOverUSBInterfaces":null}])"
              "\n");
    EXPECT_EQ(port.driver(0), "usblp");
}

/// Gives a scheduler its own sample drivers as if they were installed on this computer, without the
/// translations into thirty languages: an emulated processor would be busy with them for a quarter of a
/// minute each time.
void installSampleDrivers(const PrivateScheduler& scheduler) {
    const auto folder = scheduler.folder() / "data/drv/Library";
    std::filesystem::create_directories(folder);
    std::ifstream original("/usr/share/cups/drv/sample.drv");
    std::ofstream shortened(folder / "sample.drv");
    for (std::string line; std::getline(original, line);)
        if (!line.starts_with("#po "))
            shortened << line << '\n';
}

class KernelQueue : public testing::Test {
protected:
    KernelQueue() { installSampleDrivers(scheduler); }

    PrivateScheduler scheduler{{.models = {{}}}};
    Agent agent{scheduler};
};

TEST_F(KernelQueue, PrintsThroughTheStockBackendToThePrinter) {
    VhciPort port({.deviceID = kPclID});
    useStockUsbBackend(scheduler, VENTRAS_USB_BACKEND);
    const auto run = agent.run({kLocation}, kLimit);
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    ASSERT_EQ(scheduler.queues(), Names{run.queueID()});
    EXPECT_EQ(scheduler.attribute(run.queueID(), "device-uri"), "usb://HP/HP%20LaserJet?serial=C4");
    EXPECT_EQ(scheduler.attribute(run.queueID(), "printer-make-and-model"), "HP LaserJet Series PCL 4/5");
    EXPECT_EQ(port.driver(0), "usblp");
    EXPECT_THAT(agent.leftovers(), IsEmpty());

    scheduler.print(run.queueID(), "hello.pdf", {"page-ranges=1"});
    EXPECT_TRUE(port.printer().receives(kEndOfPclPage, kLimit)) << scheduler.errorLog();
    EXPECT_TRUE(comesTrue([&] { return port.driver(0) == "usblp"; }, kLimit)) << port.driver(0);
}

TEST_F(KernelQueue, IsNotMadeForAPrinterThatSpeaksIppOverUsb) {
    const VhciPort port({.deviceID = kPclID, .settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}});
    EXPECT_EQ(agent.run({kLocation}, kLimit).exitStatus, 255);
    EXPECT_THAT(scheduler.queues(), IsEmpty());
}

TEST_F(KernelQueue, LeavesThePrinterToTheKernelsDriverWhenTheAgentIsToldToEnd) {
    VhciPort port({.deviceID = "MFG:Other;MDL:Nameless;CMD:POSTSCRIPT;SN:A1;"});
    const auto running = agent.start({kLocation});
    ASSERT_TRUE(port.printer().receives("product ==", kLimit));
    ASSERT_EQ(port.driver(0), "usbfs");
    running->signal(SIGTERM);
    EXPECT_TRUE(running->waitUntilEnded(kLimit));
    EXPECT_EQ(running->result().signal, SIGTERM);
    EXPECT_EQ(port.driver(0), "usblp");
}

}  // namespace
}  // namespace ventras
