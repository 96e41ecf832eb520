#include <gmock/gmock.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

#include "tests/agent/Agent.h"
#include "tests/parts/PostScriptInterpreter.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/StockUsbBackend.h"
#include "tests/parts/UsbBench.h"
#include "tests/usb/PostScriptPpd.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using Names = std::vector<std::string>;

constexpr const char* kLocation = "-u20971520,0";  // 1-4
constexpr const char* kBrother = "MFG:Brother;CMD:PJL,HBP;MDL:DCP-7030;CLS:PRINTER;SN:B7;";
constexpr const char* kPrologue =
    "/statusdict 10 dict def statusdict /product (Example PS 9000) put /duplexerInstalled true def /trays 2 "
    "def";

FakePrinterModel printerSaying(std::string deviceID) {
    FakePrinterModel model;
    model.deviceID = std::move(deviceID);
    return model;
}

// The whole program, a real scheduler with its real driver programs, and an emulated USB.
class UsbQueue : public testing::Test {
protected:
    /// A scheduler whose drivers count as installed on this computer: the name under which it offers them
    /// begins so. Real driver collections, and the PPD of a PostScript printer.
    void SetUp() override {
        const auto data = scheduler.folder() / "data";
        fs::create_directories(data / "drv/Library");
        for (const auto* collection : {"brlaser.drv", "sample.drv"})
            fs::copy(fs::path("/usr/share/cups/drv") / collection, data / "drv/Library");
        fs::create_directories(data / "model/Library/Printers");
        std::ofstream(data / "model/Library/Printers/exps9000.ppd") << postScriptPpd();
    }

    void useStockBackend() const { useStockUsbBackend(scheduler, VENTRAS_USB_BACKEND, bench.environment()); }

    FakePrinter& attach(FakePrinterModel model, const std::string& place = "1-4") {
        auto& printer = bench.plugIn(place, std::move(model));
        bench.node(place).bindDriver(0, "usblp");
        return printer;
    }

    UsbBench bench;
    PrivateScheduler scheduler{{.models = {{}}}};
    Agent agent{together({scheduler.environment(), bench.environment()}), std::nullopt};
};

TEST_F(UsbQueue, OfALaserPrinterHasItsOwnDriver) {
    attach(printerSaying(kBrother));
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    ASSERT_EQ(scheduler.queues(), Names{run.queueID()});
    EXPECT_EQ(scheduler.attribute(run.queueID(), "device-uri"), "usb://Brother/DCP-7030?serial=B7");
    EXPECT_THAT(scheduler.ppd(run.queueID()), HasSubstr("rastertobrlaser"));

    const auto job = scheduler.print(run.queueID(), "hello.pdf");
    EXPECT_TRUE(PrivateScheduler::appears(scheduler.sinkFile(run.queueID(), job))) << scheduler.errorLog();
    EXPECT_THAT(agent.leftovers(), IsEmpty());
    EXPECT_EQ(bench.node("1-4").driver(0), "usblp");
}

TEST_F(UsbQueue, OfAPclPrinterHasThePclDriver) {
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;"));
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler.attribute(run.queueID(), "printer-make-and-model"), "HP LaserJet Series PCL 4/5");
}

TEST_F(UsbQueue, OfAPostScriptPrinterHasWhatIsInstalledInIt) {
    attach(printerSaying("MFG:Example;MDL:PS 9000;CMD:POSTSCRIPT;SN:A1;")).interpreter =
        PostScriptInterpreter(kPrologue);
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    const auto ppd = scheduler.ppd(run.queueID());
    EXPECT_THAT(ppd, HasSubstr("*DefaultDuplexer: True"));
    EXPECT_THAT(ppd, HasSubstr("*DefaultTrays: Two"));
    EXPECT_THAT(agent.leftovers(), IsEmpty());
    EXPECT_EQ(bench.node("1-4").driver(0), "usblp");
}

TEST_F(UsbQueue, OfAnUnknownPostScriptPrinterHasTheDriverOfTheProductThatItTells) {
    attach(printerSaying("MFG:Other;MDL:Nameless;CMD:POSTSCRIPT;SN:A1;")).interpreter =
        PostScriptInterpreter(kPrologue);
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler.attribute(run.queueID(), "printer-make-and-model"), "Example PS 9000");
    EXPECT_EQ(scheduler.attribute(run.queueID(), "device-uri"), "usb://Other/Nameless?serial=A1");
}

TEST_F(UsbQueue, IsNotMadeWithoutADriver) {
    auto& silent = attach(printerSaying("MFG:Other;MDL:Nameless;CMD:PCL;SN:A1;"));
    EXPECT_EQ(agent.run({kLocation, "--download"}).exitStatus, 241);
    EXPECT_THAT(silent.received(), IsEmpty());
    attach(printerSaying("MFG:Other;MDL:Nameless;CMD:POSTSCRIPT;SN:A2;"), "1-5").interpreter =
        PostScriptInterpreter("/statusdict 10 dict def statusdict /product (Nobody knows) put");
    EXPECT_EQ(agent.run({"-u22020096,0", "--download"}).exitStatus, 241);
    EXPECT_THAT(scheduler.queues(), IsEmpty());
}

TEST_F(UsbQueue, IsMadeOnce) {
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;"));
    ASSERT_EQ(agent.run({kLocation}).exitStatus, 0);
    const auto before = stateOfQueues(scheduler, scheduler.queues());
    const auto again = agent.run({kLocation});
    EXPECT_EQ(again.exitStatus, 0) << again.story();
    EXPECT_THAT(again.queueIDs(), IsEmpty());
    EXPECT_EQ(stateOfQueues(scheduler, scheduler.queues()), before);
}

TEST_F(UsbQueue, PrintsThroughTheStockBackendToThePrinter) {
    auto& printer = attach(printerSaying(kBrother));
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    useStockBackend();
    scheduler.print(run.queueID(), "hello.pdf");
    EXPECT_TRUE(printer.receives("@PJL EOJ")) << scheduler.errorLog();
    EXPECT_THAT(printer.received(), HasSubstr("@PJL ENTER LANGUAGE = PCL"));
}

struct StockCase {
    const char *deviceID, *serialNumber, *queueURI;
};
// Devices that the stock backend lists under other URIs than those of their queues.
const StockCase kStock[] = {
    {"MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;", "C4", "usb://HP/HP%20LaserJet?serial=C4"},
    {"MFG:HP;MDL:HP LaserJet;CMD:PCL;", "", "usb://HP/HP%20LaserJet?location=1400000"},
    {"MFG:Hewlett-Packard;MDL:HP LaserJet;CMD:PCL;", "S1", "usb://Hewlett-Packard/HP%20LaserJet?serial=S1"},
    {"MFG:HP;MDL:LaserJet;CMD:PCL;", "", "usb://HP/LaserJet?location=1400000"},
    {"MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:E6;", "4536", "usb://HP/HP%20LaserJet?serial=E6"},
};

TEST_F(UsbQueue, PrintsThoughTheStockBackendKnowsThePrinterByAnotherURI) {
    useStockBackend();
    for (const auto& [deviceID, serialNumber, queueURI] : kStock) {
        auto model = printerSaying(deviceID);
        model.serialNumber = serialNumber;
        auto& printer = attach(model);
        const auto run = agent.run({kLocation});
        ASSERT_EQ(run.exitStatus, 0) << run.story();
        EXPECT_EQ(scheduler.attribute(run.queueID(), "device-uri"), queueURI);
        scheduler.print(run.queueID(), "hello.pdf");
        EXPECT_TRUE(printer.receives(kEndOfPclPage)) << queueURI << '\n' << scheduler.errorLog();
        bench.unplug("1-4");
    }
}

TEST_F(UsbQueue, PrintsToTheRightOneOfTwoPrintersOnceItIsThere) {
    useStockBackend();
    auto model = printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;");
    model.serialNumber = "4334";
    attach(model);
    const auto run = agent.run({kLocation});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    bench.unplug("1-4");
    auto other = printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:D5;");
    other.serialNumber = "4435";
    auto& wrong = attach(other, "1-5");
    scheduler.print(run.queueID(), "hello.pdf");
    std::this_thread::sleep_for(3s);
    EXPECT_THAT(wrong.received(), IsEmpty());
    auto& right = attach(model, "2-1");
    EXPECT_TRUE(right.receives(kEndOfPclPage)) << scheduler.errorLog();
    EXPECT_THAT(wrong.received(), IsEmpty());
}

TEST_F(UsbQueue, IsNotMadeForAPrinterThatSpeaksIppOverUsb) {
    auto model = printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;");
    model.settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}};
    attach(model);
    EXPECT_EQ(agent.run({kLocation}).exitStatus, 255);
    EXPECT_THAT(scheduler.queues(), IsEmpty());
}

TEST_F(UsbQueue, IsMadeForEachOfSeveralPrinters) {
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:1;"));
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:2;"), "2-1.3.2");
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:3;"), "1-5");
    const auto run = agent.run({kLocation, "-u34807808,0"});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs().size(), 2U) << run.story();
    EXPECT_EQ(bench.node("1-5").timesOpened(), 0);
}

struct HopelessCase {
    const char* name;
    UsbAnswer deviceID;
};
const HopelessCase kHopeless[] = {
    {"STALL", UsbAnswer::stall()},
    {"no answer", UsbAnswer::silence()},
    {"overrun", {EOVERFLOW, {0, 9}, {}}},
    {"unplugged meanwhile", {ESHUTDOWN, {}, {}}},
    {"nothing", {}},
    {"one byte", {0, {9}, {}}},
    {"two bytes", {0, {0, 9}, {}}},
    {"length 0", UsbAnswer::deviceID(0, "MFG:HP;MDL:HP LaserJet;")},
    {"length 1", UsbAnswer::deviceID(1, "MFG:HP;MDL:HP LaserJet;")},
    {"length 2", UsbAnswer::deviceID(2, "MFG:HP;MDL:HP LaserJet;")},
    {"no UTF-8", UsbAnswer::deviceID(12, "MFG:\xff\xfe\xfd;;")},
};

TEST_F(UsbQueue, IsNotMadeForAPrinterThatDoesNotTellWhatItIs) {
    for (const auto& [name, answer] : kHopeless) {
        attach({}).fault = [&answer = answer](const UsbSetup& setup) {
            return isGetDeviceID(setup) ? std::optional{answer} : std::nullopt;
        };
        const auto run = agent.run({kLocation});
        EXPECT_EQ(run.exitStatus, 255) << name << ": " << run.story();
        bench.unplug("1-4");
    }
    EXPECT_THAT(scheduler.queues(), IsEmpty());
}

TEST_F(UsbQueue, IsMadeForAPrinterWhoseIdIsOddButReadable) {
    const std::string id = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;";
    const UsbAnswer answers[] = {
        UsbAnswer::deviceID(254, id),
        UsbAnswer::deviceID(255, id),
        UsbAnswer::deviceID(65535, id),
        UsbAnswer::deviceID(static_cast<std::uint16_t>((id.size() + 2) << 8U), id),
        {0, UsbAnswer::deviceID(static_cast<std::uint16_t>(id.size() + 2), id).data, 300ms},
        UsbAnswer::deviceID(static_cast<std::uint16_t>(id.size() + 1), id),  // without the final ";"
    };
    for (const auto& answer : answers) {
        attach({}).fault = [&](const UsbSetup& setup) {
            return isGetDeviceID(setup) ? std::optional{answer} : std::nullopt;
        };
        const auto run = agent.run({kLocation});
        EXPECT_EQ(run.exitStatus, 0) << run.story();
        EXPECT_EQ(scheduler.attribute(run.queueID(), "device-uri"), "usb://HP/HP%20LaserJet?serial=C4");
        if (!run.queueID().empty())
            scheduler.deleteQueue(run.queueID());
        bench.unplug("1-4");
    }
}

TEST_F(UsbQueue, IsNotMadeWithoutAScheduler) {
    scheduler.stop();
    attach(printerSaying("MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;"));
    const auto run = agent.run({kLocation, "--download"});
    // Root may always try; anybody else has the right by the scheduler's socket, which is gone.
    EXPECT_EQ(run.exitStatus, geteuid() == 0 ? 241 : 77) << run.story();
    EXPECT_THAT(agent.leftovers(), IsEmpty());
}

}  // namespace
}  // namespace ventras
