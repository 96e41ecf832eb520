#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <vector>

#include "platform/RunLoop.h"
#include "platform/linux/scanners/LinuxImageDeviceBrowser.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr std::uint64_t kMask = 258;
const FakePrinterModel kMultifunction{
    .vendor = 0x04a9, .product = 0x190d, .serialNumber = "S1", .isScanner = true};

class Heard final : public ImageDeviceBrowser::Delegate {
public:
    std::vector<ImageDevice> added, removed;
    void deviceAdded(const ImageDevice& device) override { added.push_back(device); }
    void deviceRemoved(const ImageDevice& device) override { removed.push_back(device); }
};

class UsbScanners : public testing::Test {
protected:
    void SetUp() override {
        setenv("VENTRAS_SCANNER_CONFIGURATION", folder_.path().c_str(), 1);
        setenv("VENTRAS_SCANNER_MODULES", folder_.path().c_str(), 1);
        browser_.setDelegate(&heard_);
        browser_.setBrowsedDeviceTypeMask(kMask);
    }

    // Handles events until `condition` holds, within a second.
    template <class Condition>
    bool eventually(Condition condition) {
        for (const auto deadline = Deadline::after(1s); !condition() && !deadline.passed();)
            runLoop_.runUntil(Deadline::after(5ms));
        return condition();
    }

    TemporaryFolder folder_;
    UsbBench bench_;
    RunLoop runLoop_;
    Heard heard_;
    LinuxImageDeviceBrowser browser_;
};

TEST_F(UsbScanners, AreDescribedWithoutBeingAsked) {
    bench_.plugIn("1-2.4", kMultifunction);
    browser_.start();
    const auto devices = browser_.devices();
    ASSERT_EQ(devices.size(), 1U);
    EXPECT_EQ(devices[0].transport, ImageDeviceTransport::kUSB);
    EXPECT_EQ(devices[0].usbLocation, 0x01240000U);
    EXPECT_EQ(devices[0].usbVendor, 0x04a9);
    EXPECT_EQ(devices[0].usbProduct, 0x190d);
    EXPECT_EQ(devices[0].serialNumber, "S1");
    EXPECT_EQ(devices[0].uuidString.size(), 36U);
    EXPECT_EQ(devices[0].modulePath, std::nullopt);
}

TEST_F(UsbScanners, KeepTheirUUIDWhereverTheyArePlugged) {
    bench_.plugIn("1-1", kMultifunction);
    browser_.start();
    const auto before = browser_.devices().at(0).uuidString;
    bench_.unplug("1-1");
    bench_.plugIn("2-3", kMultifunction);
    EXPECT_TRUE(eventually([&] { return heard_.added.size() == 2; }));
    ASSERT_EQ(browser_.devices().size(), 1U);
    EXPECT_EQ(browser_.devices()[0].uuidString, before);
    EXPECT_EQ(browser_.devices()[0].usbLocation, 0x02300000U);
}

TEST_F(UsbScanners, WithoutSerialNumbersAreToldApartByTheirPlace) {
    auto anonymous = kMultifunction;
    anonymous.serialNumber = "";
    bench_.plugIn("1-1", anonymous);
    bench_.plugIn("1-2", anonymous);
    browser_.start();
    const auto devices = browser_.devices();
    ASSERT_EQ(devices.size(), 2U);
    EXPECT_NE(devices[0].uuidString, devices[1].uuidString);
}

TEST_F(UsbScanners, AreOnlyThoseThatTheScannerDriversKnow) {
    bench_.plugIn("1-1");
    browser_.start();
    EXPECT_TRUE(browser_.devices().empty());
}

TEST_F(UsbScanners, ComeAndGo) {
    browser_.start();
    EXPECT_TRUE(browser_.devices().empty());
    bench_.plugIn("1-1", kMultifunction);
    EXPECT_TRUE(eventually([&] { return heard_.added.size() == 1; }));
    bench_.unplug("1-1");
    EXPECT_TRUE(eventually([&] { return heard_.removed.size() == 1; }));
    EXPECT_EQ(heard_.added.at(0).uuidString, heard_.removed.at(0).uuidString);
    EXPECT_TRUE(browser_.devices().empty());
}

TEST_F(UsbScanners, AreServedByTheModuleWhoseConfigurationNamesThem) {
    folder_.write("zeta.conf", "usb 0x04a9 0x190d\n");
    folder_.write("acme.conf", "# usb 0x04a9 0x190d\nusb 0x04a9 0x190dd\nusb  0x04A9   0x190D extra\n");
    folder_.write("libsane-acme.so.1", "");
    folder_.write("libsane-zeta.so.1", "");
    bench_.plugIn("1-1", kMultifunction);
    browser_.start();
    EXPECT_EQ(browser_.devices().at(0).modulePath, (folder_ / "libsane-acme.so.1").string());
}

TEST_F(UsbScanners, HaveNoModuleThatIsNotInstalled) {
    folder_.write("acme.conf", "usb 0x04a9 0x190d\n");
    bench_.plugIn("1-1", kMultifunction);
    browser_.start();
    EXPECT_EQ(browser_.devices().at(0).modulePath, std::nullopt);
}

TEST_F(UsbScanners, AreLookedForAnewWhenSoftwareWasInstalled) {
    bench_.plugIn("1-1", kMultifunction);
    browser_.start();
    EXPECT_EQ(browser_.devices().at(0).modulePath, std::nullopt);
    folder_.write("acme.conf", "usb 0x04a9 0x190d\n");
    folder_.write("libsane-acme.so.1", "");
    browser_.announceNewSoftwareInstalled();
    ASSERT_EQ(browser_.devices().size(), 1U);
    EXPECT_EQ(browser_.devices()[0].modulePath, (folder_ / "libsane-acme.so.1").string());
}

TEST_F(UsbScanners, AreNotWatchedForUnderAnotherMask) {
    bench_.plugIn("1-1", kMultifunction);
    for (const std::uint64_t mask : {0x0U, 0x2U, 0x100U, 0xfe00U}) {
        LinuxImageDeviceBrowser browser;
        browser.setBrowsedDeviceTypeMask(mask);
        browser.start();
        EXPECT_TRUE(browser.devices().empty()) << mask;
    }
}

TEST_F(UsbScanners, WithOddDescriptionsAreLeftOut) {
    auto odd = kMultifunction;
    odd.serialNumber = std::string(5000, 's');
    bench_.plugIn("1-1", odd);
    browser_.start();
    EXPECT_EQ(browser_.devices().at(0).serialNumber.size(), 5000U);
}

TEST_F(UsbScanners, NeverHoldTheirWatcherUp) {
    bench_.plugIn("1-1", kMultifunction);
    const auto begin = std::chrono::steady_clock::now();
    for (int i = 0; i < 20; ++i) {
        LinuxImageDeviceBrowser browser;
        browser.setBrowsedDeviceTypeMask(kMask);
        browser.start();
    }
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 5s);
}

}  // namespace
}  // namespace ventras

int main(int count, char** arguments) {
    ventras::UsbBench::enter(arguments);
    testing::InitGoogleTest(&count, arguments);
    return RUN_ALL_TESTS();
}
