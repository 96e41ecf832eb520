#include <gmock/gmock.h>

#include <chrono>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "tests/kernel/VhciPort.h"
#include "tests/machine/HttpOverUsb.h"
#include "tests/machine/Machine.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/Program.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* kID = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:M1;";
constexpr const char* kURI = "usb://HP/HP%20LaserJet?serial=M1";

// An emulated processor is slow.
constexpr auto kLimit = 180s;

// What systemd says at the end of each run of the agent that it takes for a good one.
constexpr const char* kGoodEnd = "Deactivated successfully";

class PluggedIn : public testing::Test {
protected:
    static bool hasEnded(long times) {
        return comesTrue([&] { return Machine::timesInJournal(kGoodEnd) >= times; }, kLimit);
    }

    void TearDown() override { EXPECT_THAT(Machine::failedUnits(), IsEmpty()) << Machine::journal(); }

    long endsBefore = Machine::timesInJournal(kGoodEnd);
};

TEST_F(PluggedIn, PrinterHasAQueueThatPrints) {
    VhciPort port({.deviceID = kID});
    ASSERT_TRUE(hasEnded(endsBefore + 1)) << Machine::journal();
    const auto queue = Machine::queueOf(kURI);
    ASSERT_NE(queue, "") << Machine::journal();
    const auto lp = runProgram({"lp", "-d", queue, "/etc/hostname"});
    EXPECT_EQ(lp.exitStatus, 0) << lp.standardError;
    EXPECT_TRUE(port.printer().receives(kEndOfPclPage, kLimit));
}

TEST_F(PluggedIn, PrinterHasOneQueueHoweverOftenItComesBack) {
    for (int i = 1; i <= 2; ++i) {
        const VhciPort port({.deviceID = kID});
        ASSERT_TRUE(hasEnded(endsBefore + i)) << Machine::journal();
    }
    EXPECT_EQ(Machine::queues().size(), 1U);
    EXPECT_NE(Machine::queueOf(kURI), "");
}

TEST_F(PluggedIn, PrinterWithoutADriverIsNoFailureOfAService) {
    const auto before = Machine::queues();
    const VhciPort port({.deviceID = "MFG:Acme;MDL:Winjet;CMD:GDI;SN:M2;"});
    ASSERT_TRUE(hasEnded(endsBefore + 1)) << Machine::journal();
    EXPECT_EQ(Machine::queues(), before);
}

TEST_F(PluggedIn, PrinterIsThereBeforeThePackage) {
    ASSERT_EQ(runProgram({"dpkg", "--remove", "ventrasagent"}, {}, kLimit).exitStatus, 0);
    const VhciPort port({.deviceID = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:M4;"});
    const auto installed =
        runProgram({"sh", "-c", "dpkg --install /package/ventrasagent_*-1_*.deb"}, {}, kLimit);
    ASSERT_EQ(installed.exitStatus, 0) << installed.standardError;
    ASSERT_TRUE(hasEnded(endsBefore + 1)) << Machine::journal();
    EXPECT_NE(Machine::queueOf("usb://HP/HP%20LaserJet?serial=M4"), "") << Machine::journal();
}

// A printer with IPP over USB, as many are: the older protocol comes first, and has to be left.
class PluggedInWithIppOverUsb : public PluggedIn {
protected:
    std::unique_ptr<VhciPort> plugIn() const {
        auto port = std::make_unique<VhciPort>(FakePrinterModel{
            .deviceID = "MFG:Acme;MDL:Laser;CMD:PDF,URF;SN:M3;",
            .manufacturer = "Acme",
            .productName = "Laser",
            .serialNumber = "M3",
            .settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}, {1, 0, 255, 0, 0}, {1, 1, 7, 1, 4}}});
        port->printer().http = [wire = std::make_shared<HttpOverUsb>(inside.port())](std::uint8_t interface,
                                                                                     std::string_view data) {
            return (*wire)(interface, data);
        };
        return port;
    }

    /// The queues of all such printers.
    static std::vector<std::string> queues() {
        std::vector<std::string> names;
        for (const auto& [name, uri] : Machine::queues())
            if (uri.starts_with("ippusb://"))
                names.push_back(name);
        return names;
    }

    /// Prints, and expects as many documents to have come out by then.
    void expectPrinted(const std::string& queue, std::size_t documents) const {
        const auto lp = runProgram({"lp", "-d", queue, "/etc/hostname"});
        EXPECT_EQ(lp.exitStatus, 0) << lp.standardError;
        EXPECT_TRUE(inside.receivedWithin(kLimit, documents)) << inside.log() << Machine::journal();
    }

    VirtualPrinter inside{{.name = "Inside", .make = "Acme", .model = "Laser"}};
};

TEST_F(PluggedInWithIppOverUsb, PrinterHasAQueueThatPrintsAgainWhenItComesBack) {
    auto port = plugIn();
    ASSERT_TRUE(comesTrue([] { return !queues().empty(); }, kLimit)) << Machine::journal();
    const auto queue = queues().front();
    expectPrinted(queue, 1);
    port.reset();
    port = plugIn();
    expectPrinted(queue, 2);
    EXPECT_THAT(queues(), ElementsAre(queue));
}

}  // namespace
}  // namespace ventras
