#include <cups/backend.h>
#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <future>
#include <thread>

#include "tests/parts/Loopback.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PpdTexts.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
namespace fs = std::filesystem;

// Stands where the stock backend stands and tells how it was called.
constexpr std::string_view kStockBackend = R"(#!/bin/sh
echo "uri=$DEVICE_URI"
for argument; do echo "argument=$argument"; done
cat
exit 3
)";

const std::string kURI = "ippusb://Laser%209%20(USB)._ipp._tcp.local./?uuid=ab12";

class IppUsbBackend : public testing::Test {
protected:
    IppUsbBackend() {
        fs::permissions(folder_.write("backend/ipp", kStockBackend), fs::perms{0755});
        environment_ = {{"CUPS_SERVERBIN", folder_.path()}, {"DEVICE_URI", kURI}};
    }

    PublishedService laser(std::initializer_list<std::string> txt = {"rp=ipp/print", "rfo=ipp/faxout",
                                                                     "UUID=ab12"}) {
        return {.name = "Laser 9 (USB)", .port = printer_.port(), .txt = txtRecord(txt)};
    }
    std::string address(const std::string& resource) const {
        return "uri=ipp://localhost:" + std::to_string(printer_.port()) + resource + "\n";
    }

    ProgramResult run(std::vector<std::string> arguments = {"7", "me", "title", "1", ""},
                      std::chrono::milliseconds limit = 20s) {
        arguments.insert(arguments.begin(), VENTRAS_BACKEND);
        return runProgram(arguments, {.environment = environment_, .standardInput = "the document"}, limit);
    }
    std::string firstLine() {
        const auto output = run().standardOutput;
        return output.substr(0, output.find('\n') + 1);
    }

    TemporaryFolder folder_;
    PrivateResponder responder_;
    ListeningSocket printer_{LoopbackAddress::v4};
    Environment environment_;
};

TEST_F(IppUsbBackend, ListsItsSchemeWhenCalledWithoutArguments) {
    const auto result = run({});
    EXPECT_EQ(result.exitStatus, CUPS_BACKEND_OK);
    EXPECT_EQ(result.standardOutput, "direct ippusb \"Unknown\" \"Printer with IPP over USB\"\n");
    EXPECT_EQ(result.standardError, "");
}

TEST_F(IppUsbBackend, RefusesAnyOtherNumberOfArgumentsThanFiveAndSix) {
    for (std::size_t count : {1U, 4U, 7U}) {
        const auto result = run(std::vector<std::string>(count, "1"));
        EXPECT_EQ(result.exitStatus, CUPS_BACKEND_STOP) << count;
        EXPECT_TRUE(result.standardError.starts_with("ERROR: Usage:")) << result.standardError;
    }
}

TEST_F(IppUsbBackend, HandsTheJobToTheStockBackendAsItIs) {
    responder_.publish(laser());
    const auto result =
        run({"7", "me; rm -rf x", "$(touch x) `y` \"z\" *", "2", "media=A4 a='b c'", "/no such file"});
    EXPECT_EQ(result.standardOutput,
              address("/ipp/print") +
                  "argument=7\nargument=me; rm -rf x\nargument=$(touch x) `y` \"z\" *\n"
                  "argument=2\nargument=media=A4 a='b c'\nargument=/no such file\n"
                  "the document");
    EXPECT_EQ(result.exitStatus, 3);
    EXPECT_EQ(result.standardError, "");
}

TEST_F(IppUsbBackend, TakesTheURIFromItsNameWhereTheSchedulerSetsNoVariable) {
    responder_.publish(laser());
    const auto result = runProgram(
        {"bash", "-c", "unset DEVICE_URI; exec -a '" + kURI + "' " + VENTRAS_BACKEND + " 7 me title 1 ''"},
        {.environment = environment_});
    EXPECT_TRUE(result.standardOutput.starts_with(address("/ipp/print"))) << result.standardOutput;
}

struct ResourceCase {
    const char* what;
    std::string txt, fax;
    const char* expected;
};

const ResourceCase kResources[] = {
    {"named", "rp=printers/one", "", "/printers/one"},
    {"with a leading slash", "rp=/printers/one", "", "/printers/one"},
    {"not named", "note=x", "", "/ipp/print"},
    {"empty", "rp=", "", "/ipp/print"},
    {"with a blank", "rp=a b", "", "/a%20b"},
    {"with a line end", "rp=a\nSTATE: x", "", "/ipp/print"},
    {"for a fax", "rfo=ipp/fax", "*cupsFax: True\n", "/ipp/fax"},
    {"for a fax, in lower case", "rfo=ipp/fax", "*cupsFax: true\n", "/ipp/fax"},
    {"for a fax, not named", "rp=x", "*cupsFax: True\n", "/ipp/faxout"},
    {"for no fax", "rfo=ipp/fax", "*cupsFax: False\n", "/ipp/print"},
};

TEST_F(IppUsbBackend, PrintsToTheResourceThatTheRecordNames) {
    int number = 0;
    for (const auto& [what, txt, fax, expected] : kResources) {
        const auto name = "Printer" + std::to_string(++number);
        responder_.publish({.name = name, .port = printer_.port(), .txt = txtRecord({txt})});
        environment_["DEVICE_URI"] = "ippusb://" + name + "._ipp._tcp.local./";
        environment_["PPD"] = folder_.write("queue.ppd", ppdWith(fax));
        EXPECT_EQ(firstLine(), address(expected)) << what;
    }
}

TEST_F(IppUsbBackend, StopsTheQueueForAURIOfAnotherScheme) {
    for (const char* uri : {"ipp://localhost/ipp/print", "", "ippusb:", "file:///etc/passwd"}) {
        environment_["DEVICE_URI"] = uri;
        const auto result = run();
        EXPECT_EQ(result.exitStatus, CUPS_BACKEND_STOP) << uri;
        EXPECT_TRUE(result.standardError.starts_with("ERROR: ")) << result.standardError;
    }
}

constexpr const char* kAway =
    "STATE: +offline-report\n"
    "INFO: The printer is unplugged or switched off, or its IPP-over-USB service is not running.\n";

TEST_F(IppUsbBackend, WaitsForAPrinterThatIsNotRegistered) {
    const auto result = run({"7", "me", "title", "1", ""}, 6s);
    EXPECT_TRUE(result.timedOut);
    EXPECT_EQ(result.signal, SIGTERM);
    EXPECT_EQ(result.standardError, kAway);
    EXPECT_EQ(result.standardOutput, "");
}

TEST_F(IppUsbBackend, WaitsWhileAnotherPrinterHasTheName) {
    responder_.publish(laser({"rp=ipp/print", "UUID=cd34"}));
    const auto result = run({"7", "me", "title", "1", ""}, 2s);
    EXPECT_TRUE(result.timedOut);
    EXPECT_EQ(result.standardError, kAway);
}

TEST_F(IppUsbBackend, WaitsWhileNobodyListensAtThePrintersPort) {
    auto service = laser();
    service.port = freePort();
    responder_.publish(service);
    const auto result = run({"7", "me", "title", "1", ""}, 2s);
    EXPECT_TRUE(result.timedOut);
    EXPECT_EQ(result.standardError, kAway);
}

TEST_F(IppUsbBackend, WaitsWhileTheResponderHangs) {
    responder_.publish(laser());
    responder_.suspend();
    const auto result = run({"7", "me", "title", "1", ""}, 5s);
    EXPECT_TRUE(result.timedOut);
    EXPECT_EQ(result.standardError, kAway);
}

TEST_F(IppUsbBackend, TakesThePrinterOfTheNameWhereEitherSideHasNoUUID) {
    responder_.publish(laser({"rp=ipp/print"}));
    EXPECT_EQ(firstLine(), address("/ipp/print"));
    environment_["DEVICE_URI"] = "ippusb://Laser%209%20(USB)._ipp._tcp.local./";
    EXPECT_EQ(firstLine(), address("/ipp/print"));
}

TEST_F(IppUsbBackend, GoesOnAsSoonAsThePrinterIsThere) {
    auto late = std::async(std::launch::async, [this] { return run(); });
    std::this_thread::sleep_for(4s);
    responder_.publish(laser());
    const auto result = late.get();
    EXPECT_EQ(result.standardError, std::string(kAway) + "STATE: -offline-report\n");
    EXPECT_TRUE(result.standardOutput.starts_with(address("/ipp/print"))) << result.standardOutput;
}

TEST_F(IppUsbBackend, GivesAJobOfAClassBackAfterOneWait) {
    environment_["CLASS"] = "all";
    const auto result = run();
    EXPECT_EQ(result.exitStatus, CUPS_BACKEND_FAILED);
    EXPECT_EQ(result.standardError, kAway);
}

TEST_F(IppUsbBackend, SaysThatTheStockBackendIsMissing) {
    responder_.publish(laser());
    fs::remove(folder_ / "backend/ipp");
    const auto result = run();
    EXPECT_EQ(result.exitStatus, CUPS_BACKEND_FAILED);
    EXPECT_TRUE(result.standardError.starts_with("ERROR: Unable to start ")) << result.standardError;
}

}  // namespace
}  // namespace ventras
