#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <memory>

#include "platform/PrintSystemService.h"
#include "tests/agent/Agent.h"
#include "tests/ippusb/FaxPrinter.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/Loopback.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Names = std::vector<std::string>;

const std::string kUUID = "12345678-9abc-def0-1234-56789abcdef0";
const std::string kName = "Acme Laser 9 (USB)";
const std::string kDeviceURI = "ippusb://Acme%20Laser%209%20(USB)._ipp._tcp.local./?uuid=" + kUUID;

constexpr const char* kBusVariable = "DBUS_SYSTEM_BUS_ADDRESS";

// The backend that was built, in place of the one that lays jobs down as files. The scheduler passes little
// of its own environment on.
std::map<std::string, std::string> builtBackend() {
    return {{"ippusb", "#!/bin/sh\nexport " + std::string(kBusVariable) + "=" + std::getenv(kBusVariable) +
                           "\nexec " + VENTRAS_BACKEND + " \"$@\"\n"}};
}

Environment withBus(Environment environment) {
    environment[kBusVariable] = std::getenv(kBusVariable);
    return environment;
}

// The whole program, a real responder, a real scheduler and a printer behind a registered service.
class IppUsbPrinter : public testing::Test {
protected:
    PublishedService service(const std::string& name = kName) const { return service(printer_, name); }
    static PublishedService service(const FaxPrinter& printer, const std::string& name) {
        return {.name = name,
                .port = printer.port(),
                .txt = txtRecord({"txtvers=1", "rp=ipp/print", "rfo=ipp/faxout", "UUID=" + kUUID,
                                  "usb_MFG=Acme", "usb_MDL=Acme Laser 9", "usb_SN=A1", "Fax=T"})};
    }

    AgentRun runAgent(const std::string& name = kName) { return agent_.run({"ippusb://" + name}); }

    ProgramResult runTool(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), VENTRAS_TOOL);
        return runProgram(arguments, {.environment = scheduler_.environment()});
    }

    // Waits until an attribute of a queue says so.
    bool becomes(const std::string& queue, const std::string& attribute, const std::string& value) const {
        return comesTrue([&] { return scheduler_.attribute(queue, attribute) == value; }, 20s);
    }

    FaxPrinter printer_;
    PrivateResponder responder_;
    PrivateScheduler scheduler_{{.backends = builtBackend()}};
    Agent agent_{withBus(scheduler_.environment()), std::nullopt};
};

TEST_F(IppUsbPrinter, GetsAQueueAndAFaxQueueAndPrintsToBothServices) {
    responder_.publish(service());
    const auto run = runAgent();
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    ASSERT_EQ(run.queueIDs().size(), 2U) << run.story();
    const auto print = run.queueIDs().at(0);
    const auto fax = run.queueIDs().at(1);
    EXPECT_EQ(scheduler_.attribute(print, "device-uri"), kDeviceURI);
    EXPECT_EQ(scheduler_.attribute(fax, "device-uri"), kDeviceURI);
    EXPECT_EQ(scheduler_.attribute(print, "printer-make-and-model").substr(0, 10), "Acme Laser");
    EXPECT_EQ(scheduler_.attribute(fax, "printer-make-and-model").substr(0, 8), "Acme Fax");
    EXPECT_EQ(agent_.leftovers(), Names{});
    EXPECT_EQ(run.standardError, "");

    scheduler_.print(print, "hello.pdf");
    ASSERT_TRUE(printer_.receivedWithin(30s, 1)) << scheduler_.errorLog();
    scheduler_.print(fax, "hello.pdf", {"phone=5551234"});
    ASSERT_TRUE(printer_.receivedWithin(30s, 2)) << scheduler_.errorLog();
    const auto documents = printer_.documents();
    EXPECT_EQ(documents[0].resource, FaxPrinter::kPrintResource);
    EXPECT_FALSE(documents[0].content.empty());
    EXPECT_EQ(documents[1].resource, FaxPrinter::kFaxResource);
    EXPECT_EQ(documents[1].destination, "tel:5551234");
    EXPECT_FALSE(documents[1].content.empty());
}

TEST_F(IppUsbPrinter, KeepsItsQueuesAsTheyAreInALaterRun) {
    responder_.publish(service());
    ASSERT_EQ(runAgent().exitStatus, 0);
    const auto queues = scheduler_.queues();
    ASSERT_EQ(queues.size(), 2U);
    const auto before = stateOfQueues(scheduler_, queues);
    const auto again = runAgent();
    EXPECT_EQ(again.exitStatus, 0) << again.story();
    EXPECT_EQ(again.queueIDs(), Names{});
    EXPECT_EQ(scheduler_.queues(), queues);
    EXPECT_EQ(stateOfQueues(scheduler_, queues), before);
}

TEST_F(IppUsbPrinter, GetsNoQueueWhereItIsKnownByItsUsbURI) {
    scheduler_.addQueue("Old", "usb://Acme/Acme%20Laser%209?serial=A1");
    responder_.publish(service());
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{"Old"});
}

constexpr const char* kOddNames[] = {"Laser",
                                     "A/B \"C\" 'D'",
                                     "dots.and.dots",
                                     "B\xc3\xbcro \xe6\x97\xa5\xe6\x9c\xac",
                                     "back\\slash & (100%)",
                                     "a very long name that has exactly sixty-three bytes in it all!!"};

TEST_F(IppUsbPrinter, PrintsUnderAnyNameThatAServiceCanHave) {
    for (const std::string name : kOddNames) {
        responder_.withdrawAll();
        responder_.publish(service(name));
        const auto before = printer_.documents().size();
        const auto run = runAgent(name);
        ASSERT_EQ(run.queueIDs().size(), 2U) << name << '\n' << run.story();
        scheduler_.print(run.queueIDs().front(), "hello.pdf");
        EXPECT_TRUE(printer_.receivedWithin(30s, before + 1)) << name << '\n' << scheduler_.errorLog();
        for (const auto& queue : run.queueIDs())
            scheduler_.deleteQueue(queue);
    }
}

TEST_F(IppUsbPrinter, CountsAsServedWhileNobodyKnowsIt) {
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.standardError, "");
    EXPECT_LT(run.wallTime, 6s);
    EXPECT_EQ(scheduler_.queues(), Names{});
}

TEST_F(IppUsbPrinter, CountsAsServedWithoutAResponder) {
    responder_.kill();
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.standardError, "");
    EXPECT_LT(run.wallTime, 3s);
}

TEST_F(IppUsbPrinter, CountsAsServedWhileTheResponderHangs) {
    responder_.publish(service());
    responder_.suspend();
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.standardError, "");
    EXPECT_LT(run.wallTime, 6s);
    EXPECT_EQ(scheduler_.queues(), Names{});
}

TEST_F(IppUsbPrinter, IsShownByTheServiceCommand) {
    responder_.publish({.name = kName,
                        .txt = txtRecord({"usb_MFG=Acme", "usb_MDL=Acme Laser 9", "URF=V1.4,CP1",
                                          "pdl=Application/PDF,image/urf", "UUID=" + kUUID})});
    const auto result = runTool({"service", "--json", kName});
    EXPECT_EQ(result.exitStatus, 0);
    EXPECT_EQ(result.standardError, "");
    EXPECT_EQ(result.standardOutput,
              R"({"attributes":{"URF":"V1.4,CP1","UUID":")" + kUUID +
                  R"(","pdl":"Application/PDF,image/urf","usb_MDL":"Acme Laser 9","usb_MFG":"Acme"},)"
                  R"("name":"Acme Laser 9","urf":"V1.4,CP1","pdl":["application/pdf","image/urf"],)"
                  R"("driverInfo":{"MANUFACTURER:":"Acme Laser 9","MODEL:":"Acme","Printer URI":")" +
                  kDeviceURI + "\"}}\n");
}

TEST_F(IppUsbPrinter, IsSearchedForOnceByTheServiceCommand) {
    const auto result = runTool({"service", "Nobody"});
    EXPECT_EQ(result.exitStatus, 1);
    EXPECT_LT(result.wallTime, 5s);
}

TEST_F(IppUsbPrinter, IsExplainedWithoutMakingAQueue) {
    responder_.publish(service());
    const auto result = runTool({"explain", "--json", "ippusb://" + kName});
    EXPECT_EQ(result.exitStatus, 0) << result.standardError;
    const auto& text = result.standardOutput;
    for (const auto& part : {R"("device":"IPPUSBObject")", R"("status":0)", R"("rfo":"ipp/faxout")"})
        EXPECT_NE(text.find(part), std::string::npos) << part << '\n' << text;
    const auto planned = text.find("\"displayName\"");
    EXPECT_NE(text.find("\"displayName\"", planned + 1), std::string::npos) << "no fax queue: " << text;
    EXPECT_EQ(scheduler_.queues(), Names{});
}

TEST_F(IppUsbPrinter, IsExplainedInOneWaitWhileNobodyKnowsIt) {
    const auto result = runTool({"explain", "--json", "ippusb://Nobody"});
    EXPECT_NE(result.standardOutput.find(R"("status":242)"), std::string::npos) << result.standardOutput;
    EXPECT_LT(result.wallTime, 5s);
}

TEST_F(IppUsbPrinter, KeepsJobsWhileItIsAwayAndPrintsThemWhenItIsBackAtAnotherPort) {
    auto printer = std::make_unique<FaxPrinter>();
    responder_.publish(service(*printer, kName));
    const auto queue = runAgent().queueIDs().at(0);
    printer.reset();
    responder_.withdrawAll();
    scheduler_.print(queue, "hello.pdf");
    EXPECT_TRUE(becomes(queue, "printer-state-reasons", "offline-report"));
    EXPECT_TRUE(
        becomes(queue, "printer-state-message",
                "The printer is unplugged or switched off, or its IPP-over-USB service is not running."));

    const FaxPrinter elsewhere;
    responder_.publish(service(elsewhere, kName));
    EXPECT_TRUE(elsewhere.receivedWithin(30s, 1)) << scheduler_.errorLog();
    EXPECT_TRUE(becomes(queue, "printer-state-reasons", "none"));
}

// Without the printer's own description there is no driver, and a queue without one would send anything as it
// is.
TEST_F(IppUsbPrinter, GetsNoQueueWhileItIsRegisteredButDoesNotAnswer) {
    auto gone = service();
    gone.port = freePort();
    responder_.publish(gone);
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, PrintSystemStatus::kUnavailable) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{});
    EXPECT_EQ(agent_.leftovers(), Names{});
}

TEST_F(IppUsbPrinter, KeepsItsQueueWhenItsFaxServiceHangs) {
    const FaxPrinter deaf(FaxService::Hangs);
    responder_.publish(service(deaf, kName));
    const auto run = runAgent();
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{run.queueID()});
    EXPECT_EQ(agent_.leftovers(), Names{});
    EXPECT_LT(run.wallTime, 45s);
}

}  // namespace
}  // namespace ventras
