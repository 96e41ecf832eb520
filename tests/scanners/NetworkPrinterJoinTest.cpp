#include <gmock/gmock.h>

#include <chrono>
#include <cstdlib>
#include <string>

#include "tests/agent/Agent.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using testing::HasSubstr;

const std::string kUUID = "0f1e2d3c-4b5a-6978-8796-a5b4c3d2e1f0";

ScriptedPrinterOptions multifunctionPrinter() {
    return {.edit = [](ipp_t* answer) {
        setAttribute(answer, IPP_TAG_URI, "printer-uuid", "urn:uuid:" + kUUID);
    }};
}

Environment withBus(Environment environment) {
    environment["DBUS_SYSTEM_BUS_ADDRESS"] = std::getenv("DBUS_SYSTEM_BUS_ADDRESS");
    return environment;
}

// Scanners of this very computer are watched for when a printer of that kind is named; the one named here
// does not exist, and takes the time in which the scanner is found.
TEST(NetworkPrinter, IsJoinedWithItsScannerByTheirUUID) {
    PrivateResponder responder;
    PublishedService scanner;
    scanner.name = "Multi One";
    scanner.type = "_uscan._tcp";
    scanner.txt = txtRecord({"txtvers=1", "UUID=" + kUUID, "rs=eSCL"});
    responder.publish(scanner);
    const PrivateScheduler scheduler;
    const Agent agent{withBus(scheduler.environment()), std::nullopt};
    const ScriptedPrinter printer{multifunctionPrinter()};

    const std::vector<std::string> arguments{printer.uri(), "ippusb://Nobody"};
    const auto run = agent.run(arguments);
    ASSERT_EQ(run.queueIDs().size(), 1U) << run.story();
    const auto queues = scheduler.queues();
    EXPECT_THAT(scheduler.ppd(run.queueID()), HasSubstr("*QLScannerUUID: \"" + kUUID + "\"\n"))
        << run.story();

    const auto before = stateOfQueues(scheduler, queues);
    agent.run(arguments);
    EXPECT_EQ(scheduler.queues(), queues);
    EXPECT_EQ(stateOfQueues(scheduler, queues), before);
}

}  // namespace
}  // namespace ventras
