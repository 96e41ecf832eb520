#include <gmock/gmock.h>

#include <filesystem>
#include <string>

#include "tests/agent/Agent.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;
using Names = std::vector<std::string>;

constexpr const char* kFlatbed = "--scannerU-1,P,Flatbed,/icon,USB,1,2,3";
constexpr const char* kPrinterHalf = "-u20971520,0";  // 1-4
constexpr const char* kScannerHalf = "--scannerU-9,P,Multi,/icon,USB,20971520,1,2322,/lib/module";

// The whole program, a real scheduler, and an emulated USB with a module for its scanners.
class ScannerRun : public testing::Test {
protected:
    void SetUp() override {
        modules_.write("acme.conf", "usb 0x0912 0x0001\n");
        modules_.write("libsane-acme.so.1", "");
        // Drivers below a folder of this name count as installed on this computer.
        const auto drivers = scheduler_.folder() / "data/drv/Library";
        std::filesystem::create_directories(drivers);
        std::filesystem::copy("/usr/share/cups/drv/sample.drv", drivers);
    }

    void plugInMultifunctionDevice() {
        FakePrinterModel model;
        model.deviceID = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;";
        model.serialNumber = "C4";
        model.isScanner = true;
        bench_.plugIn("1-4", model);
    }

    Environment environment() const {
        auto all = together({scheduler_.environment(), bench_.environment()});
        all["VENTRAS_SCANNER_CONFIGURATION"] = modules_.path();
        all["VENTRAS_SCANNER_MODULES"] = modules_.path();
        return all;
    }

    TemporaryFolder modules_;
    UsbBench bench_;
    PrivateScheduler scheduler_{{.models = {{}}}};
    Agent agent_{environment(), std::nullopt};
};

TEST_F(ScannerRun, MakesAQueueThatStandsForTheScanner) {
    const auto run = agent_.run({kFlatbed});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{"Flatbed"});
    EXPECT_EQ(scheduler_.attribute("Flatbed", "device-uri"), "usb://U-1");
    EXPECT_THAT(scheduler_.ppd("Flatbed"), HasSubstr("*QLScannerOnly: True\n*QLScannerUUID: \"U-1\"\n"));
    EXPECT_THAT(agent_.leftovers(), IsEmpty());
    EXPECT_THAT(runProgram({"lpstat", "-d"}, {.environment = scheduler_.environment()}).standardOutput,
                HasSubstr("no system default"));
}

TEST_F(ScannerRun, MakesThatQueueOnce) {
    ASSERT_EQ(agent_.run({kFlatbed}).exitStatus, 0);
    const auto before = stateOfQueues(scheduler_, {"Flatbed"});
    const auto again = agent_.run({kFlatbed});
    EXPECT_EQ(again.exitStatus, 0) << again.story();
    EXPECT_EQ(scheduler_.queues(), Names{"Flatbed"});
    EXPECT_EQ(stateOfQueues(scheduler_, {"Flatbed"}), before);
}

TEST_F(ScannerRun, TakesBothSpellingsOfTheOption) {
    ASSERT_EQ(agent_.run({"-sU-1,P,Flatbed,/icon,USB,1,2,3"}).exitStatus, 0);
    EXPECT_EQ(scheduler_.attribute("Flatbed", "device-uri"), "usb://U-1");
}

TEST_F(ScannerRun, HasNoDeviceForADescriptionThatIsNone) {
    for (const auto* argument :
         {"--scanner", "-s", "--scannerU,P,N,/i,USB,1,2", "--scannerU,P,N,/i,TCP/IP,x"})
        EXPECT_EQ(agent_.run({argument}).exitStatus, 255) << argument;
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
}

TEST_F(ScannerRun, RefusesADescriptionThatWouldSmuggleInAFilter) {
    const auto run =
        agent_.run({"--scannerU-1,P,A\"\n*cupsFilter: \"application/pdf 0 evil\"\n*X: \",/i,USB,1,2,3"});
    EXPECT_EQ(run.exitStatus, 65) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr("usb://U-1"));
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
    EXPECT_THAT(agent_.leftovers(), IsEmpty());
}

TEST_F(ScannerRun, RecordsTheScannerOfAPrinterThatItSetsUp) {
    plugInMultifunctionDevice();
    const auto run = agent_.run({kPrinterHalf});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    const auto ppd = scheduler_.ppd(run.queueID());
    EXPECT_THAT(ppd, HasSubstr("\n*QLScannerUUID: \""));
    EXPECT_THAT(ppd,
                HasSubstr("\n*QLScannerModulePath: \"" + (modules_ / "libsane-acme.so.1").string() + "\"\n"));
    EXPECT_TRUE(ppd.ends_with("*QLICADriver: \"True\"\n\n")) << ppd;

    const auto before = stateOfQueues(scheduler_, scheduler_.queues());
    const auto again = agent_.run({kPrinterHalf});
    EXPECT_EQ(again.exitStatus, 0) << again.story();
    EXPECT_EQ(stateOfQueues(scheduler_, scheduler_.queues()), before);
    EXPECT_THAT(agent_.leftovers(), IsEmpty());
}

TEST_F(ScannerRun, RecordsAScannerInTheQueueOfItsPrinter) {
    plugInMultifunctionDevice();
    const auto printer = agent_.run({kPrinterHalf});
    ASSERT_EQ(printer.exitStatus, 0) << printer.story();
    const auto scanner = agent_.run({kScannerHalf});
    EXPECT_EQ(scanner.exitStatus, 0) << scanner.story();
    EXPECT_EQ(scheduler_.queues(), Names{printer.queueID()});
    EXPECT_THAT(scheduler_.ppd(printer.queueID()),
                HasSubstr("*QLScannerUUID: \"U-9\"\n*QLScannerModulePath: \"/lib/module\"\n"));
}

TEST_F(ScannerRun, CannotServeTheScannerOfAPrinterWithoutAQueue) {
    plugInMultifunctionDevice();
    const auto run = agent_.run({kScannerHalf});
    EXPECT_EQ(run.exitStatus, 255) << run.story();
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
}

}  // namespace
}  // namespace ventras
