#include <gtest/gtest.h>

#include <chrono>
#include <string>

#include "platform/RunLoop.h"
#include "platform/linux/scanners/LinuxImageDeviceBrowser.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr std::uint64_t kMask = 258;
constexpr std::uint64_t kAlsoOfThisComputer = kMask | 0xfe00;

PublishedService scannerService(const std::string& name, const std::string& type, const std::string& uuid) {
    PublishedService service;
    service.name = name;
    service.type = type;
    service.txt = txtRecord({"txtvers=1", "UUID=" + uuid, "rs=eSCL"});
    return service;
}

class NetworkScanners : public testing::Test {
protected:
    void start(std::uint64_t mask) {
        browser_.setBrowsedDeviceTypeMask(mask);
        browser_.start();
    }

    // Handles events until there are so many devices, within a few seconds.
    bool eventually(std::size_t count) {
        for (const auto deadline = Deadline::after(5s);
             browser_.devices().size() != count && !deadline.passed();)
            runLoop_.runUntil(Deadline::after(10ms));
        return browser_.devices().size() == count;
    }

    PrivateResponder responder_;
    RunLoop runLoop_;
    LinuxImageDeviceBrowser browser_;
};

TEST_F(NetworkScanners, OfIppOverUsbDevicesAreDescribed) {
    const auto service = scannerService("Multi One (USB)", "_uscan._tcp", "u-1");
    responder_.publish(service);
    start(kAlsoOfThisComputer);
    ASSERT_TRUE(eventually(1)) << responder_.log();
    const auto scanner = browser_.devices()[0];
    EXPECT_EQ(scanner.transport, ImageDeviceTransport::kTCPIP);
    EXPECT_EQ(scanner.uuidString, "u-1");
    EXPECT_EQ(scanner.txtRecord, *service.txt);
}

TEST_F(NetworkScanners, ThatAreRegisteredTwiceAreOne) {
    responder_.publish(scannerService("Multi", "_uscan._tcp", "u-1"));
    responder_.publish(scannerService("Multi", "_uscans._tcp", "u-1"));
    responder_.publish(scannerService("Other", "_uscans._tcp", "u-2"));
    start(kAlsoOfThisComputer);
    EXPECT_TRUE(eventually(2)) << responder_.log();
}

TEST_F(NetworkScanners, OfThisVeryComputerAreNotToldUnlessAskedFor) {
    responder_.publish(scannerService("Multi", "_uscan._tcp", "u-1"));
    LinuxImageDeviceBrowser other;
    other.setBrowsedDeviceTypeMask(kMask);
    other.start();
    start(kAlsoOfThisComputer);
    ASSERT_TRUE(eventually(1)) << responder_.log();
    EXPECT_TRUE(other.devices().empty());
}

TEST_F(NetworkScanners, AreNoOtherServices) {
    responder_.publish(scannerService("Printer", "_ipp._tcp", "u-1"));
    responder_.publish(scannerService("Multi", "_uscan._tcp", "u-2"));
    start(kAlsoOfThisComputer);
    ASSERT_TRUE(eventually(1)) << responder_.log();
    EXPECT_EQ(browser_.devices()[0].uuidString, "u-2");
}

TEST_F(NetworkScanners, WithoutAUUIDGetOneOfTheirName) {
    auto service = scannerService("Multi", "_uscan._tcp", "");
    service.txt = txtRecord({"rs=eSCL"});
    responder_.publish(service);
    start(kAlsoOfThisComputer);
    ASSERT_TRUE(eventually(1)) << responder_.log();
    EXPECT_EQ(browser_.devices()[0].uuidString.size(), 36U);
}

TEST_F(NetworkScanners, GoWithTheResponder) {
    responder_.publish(scannerService("Multi", "_uscan._tcp", "u-1"));
    start(kAlsoOfThisComputer);
    ASSERT_TRUE(eventually(1)) << responder_.log();
    responder_.kill();
    EXPECT_TRUE(eventually(0));
}

TEST_F(NetworkScanners, NeverHoldTheirWatcherUpWhenTheResponderHangs) {
    responder_.suspend();
    const auto begin = std::chrono::steady_clock::now();
    {
        LinuxImageDeviceBrowser browser;
        browser.setBrowsedDeviceTypeMask(kAlsoOfThisComputer);
        browser.start();
        EXPECT_TRUE(browser.devices().empty());
    }
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 2s);
    responder_.resume();
}

}  // namespace
}  // namespace ventras
