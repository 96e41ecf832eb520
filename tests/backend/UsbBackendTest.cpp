#include <cups/backend.h>
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <future>
#include <thread>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

// Stands where the stock backend is kept and tells how it was called.
constexpr std::string_view kStockBackend = R"(#!/bin/sh
if [ $# = 0 ]; then
    cat "${0%/*}/listing"
    exit
fi
echo "uri=${DEVICE_URI-none}"
for argument;
do
    echo "argument=$argument"; done
cat
exit 3
)";

class UsbBackend : public testing::Test {
protected:
    UsbBackend() {
        fs::permissions(folder_.write("daemon/stock-usb", kStockBackend), fs::perms{0755});
        list("usb://HP/LaserJet?serial=C4");
    }

    /// Plugs a printer in, and any other out.
    void list(const std::string& uri) const {
        folder_.write("listing", "direct " + uri + " \"\" \"\" \"MFG:HP;MDL:HP LaserJet;SN:C4;\" \"\"\n");
        fs::rename(folder_ / "listing", folder_ / "daemon/listing");
    }

    /// Runs the backend as the scheduler does: under the name of the device URI.
    ProgramResult run(const std::string& name, std::vector<std::string> arguments,
                      Environment environment = {}) {
        environment.emplace("CUPS_SERVERBIN", folder_.path());
        std::vector<std::string> command{"bash", "-c", "exec -a \"$0\" " VENTRAS_USB_BACKEND " \"$@\"", name};
        command.insert(command.end(), arguments.begin(), arguments.end());
        return runProgram(command, {.environment = environment, .standardInput = "the document"});
    }

    const std::string uri_ = "usb://HP/HP%20LaserJet?serial=C4";
    TemporaryFolder folder_;
};

TEST_F(UsbBackend, LetsTheStockBackendListTheDevices) {
    const auto result = run("usb", {});
    EXPECT_EQ(result.standardOutput, readFile(folder_ / "daemon/listing"));
    EXPECT_EQ(result.exitStatus, 0);
}

TEST_F(UsbBackend, HandsTheJobToTheStockBackendWithItsOwnURI) {
    const auto result =
        run(uri_, {"7", "me; rm -rf x", "$(touch x) \"z\" *", "2", "a='b c'", "/no such file"},
            {{"DEVICE_URI", uri_}});
    EXPECT_EQ(result.standardOutput,
              "uri=usb://HP/LaserJet?serial=C4\n"
              "argument=7\nargument=me; rm -rf x\nargument=$(touch x) \"z\" *\n"
              "argument=2\nargument=a='b c'\nargument=/no such file\n"
              "the document");
    EXPECT_EQ(result.exitStatus, 3);
}

TEST_F(UsbBackend, TakesTheURIFromItsNameWhereTheSchedulerSetsNoVariable) {
    const auto result = run(uri_, {"7", "me", "title", "1", ""});
    EXPECT_TRUE(result.standardOutput.starts_with("uri=usb://HP/LaserJet?serial=C4\n"))
        << result.standardOutput;
}

TEST_F(UsbBackend, CallsTheStockBackendByItsURI) {
    fs::remove(folder_ / "daemon/stock-usb");
    fs::create_symlink("/bin/bash", folder_ / "daemon/stock-usb");
    const auto result =
        run("usb://HP/HP%20LaserJet", {"-c", "tr '\\0' '\\n' </proc/$$/cmdline | head -n 1", "", "", ""});
    EXPECT_EQ(result.standardOutput, "usb://HP/LaserJet\n") << result.standardError;
}

TEST_F(UsbBackend, TakesTheSerialNumberThatThePrinterTellsOnTheBus) {
    list("usb://HP/LaserJet?serial=4334");
    const auto result = run(uri_, {"7", "me", "title", "1", ""});
    EXPECT_TRUE(result.standardOutput.starts_with("uri=usb://HP/LaserJet?serial=4334\n"))
        << result.standardOutput;
    EXPECT_EQ(result.standardError, "");
}

TEST_F(UsbBackend, WaitsForThePrinter) {
    list("usb://HP/DeskJet?serial=C4");
    auto job = std::async(std::launch::async, [this] { return run(uri_, {"7", "me", "title", "1", ""}); });
    std::this_thread::sleep_for(std::chrono::seconds(1));
    list("usb://HP/LaserJet?serial=4334");
    const auto result = job.get();
    EXPECT_EQ(result.standardError, "INFO: Waiting for printer to become available.\n");
    EXPECT_TRUE(result.standardOutput.starts_with("uri=usb://HP/LaserJet?serial=4334\n"))
        << result.standardOutput;
}

TEST_F(UsbBackend, LeavesAnAbsentPrinterOfAClassToTheStockBackend) {
    list("usb://HP/DeskJet?serial=C4");
    const auto result = run(uri_, {"7", "me", "title", "1", ""}, {{"CLASS", "all"}});
    EXPECT_TRUE(result.standardOutput.starts_with("uri=usb://HP/LaserJet?serial=C4\n"))
        << result.standardOutput;
}

TEST_F(UsbBackend, LeavesThePrinterToTheStockBackendWhereThatCannotListIt) {
    fs::remove(folder_ / "daemon/listing");
    const auto result = run(uri_, {"7", "me", "title", "1", ""});
    EXPECT_TRUE(result.standardOutput.starts_with("uri=usb://HP/LaserJet?serial=C4\n"))
        << result.standardOutput;
}

TEST_F(UsbBackend, LeavesTheWrongNumberOfArgumentsToTheStockBackend) {
    EXPECT_EQ(run(uri_, {"7"}, {{"DEVICE_URI", uri_}}).exitStatus, 3);
}

TEST_F(UsbBackend, SaysThatTheStockBackendIsMissing) {
    fs::remove(folder_ / "daemon/stock-usb");
    const auto result = run(uri_, {"7", "me", "title", "1", ""});
    EXPECT_EQ(result.exitStatus, CUPS_BACKEND_FAILED);
    EXPECT_TRUE(result.standardError.starts_with("ERROR: Unable to start ")) << result.standardError;
}

}  // namespace
}  // namespace ventras
