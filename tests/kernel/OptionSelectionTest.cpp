#include <gmock/gmock.h>

#include <algorithm>
#include <chrono>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "platform/linux/options/UsbOptionSelection.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/kernel/VhciPort.h"
#include "tests/usb/PostScriptModel.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;

/// What a PostScript interpreter says: a real one would take longer to start, on an emulated processor, than
/// it has time for an answer.
std::string answerProduct(std::string_view program) {
    return program.find("product ==") == program.npos ? "" : "(Example PS 9000)\r\n";
}

class KernelOptionSelection : public testing::Test {
protected:
    std::optional<std::string> product() {
        UsbOptionSelection selection(kPostScriptURI, fakes.log);
        status = selection.autoSelectPPD();
        return selection.autoSelectGetInfo().product;
    }

    FakePlatform fakes;
    std::int32_t status = -1;
};

TEST_F(KernelOptionSelection, AsksForTheProductAndGivesThePrinterBackToTheKernelsDriver) {
    VhciPort port(postScriptModel());
    port.printer().interpreter = answerProduct;
    ASSERT_EQ(port.driver(0), "usblp");
    EXPECT_THAT(product(), Optional("(Example PS 9000)"s));
    EXPECT_EQ(status, 0);
    EXPECT_EQ(port.driver(0), "usblp");
}

TEST_F(KernelOptionSelection, TalksThroughTheBidirectionalSettingAndPutsTheFormerOneBack) {
    auto model = postScriptModel();
    model.settings = {{0, 0, 0xFF, 0, 0}, {0, 1, 7, 1, 2}};
    VhciPort port(model);
    port.printer().interpreter = answerProduct;
    EXPECT_THAT(product(), Optional("(Example PS 9000)"s));
    EXPECT_EQ(port.printer().currentSetting(0), 0);
    EXPECT_EQ(port.driver(0), "");
}

TEST_F(KernelOptionSelection, LeavesAPrinterThatSomebodyElseUses) {
    VhciPort port(postScriptModel());
    LibusbContext context;
    int error = 0;
    const auto devices = context.devices().value();
    const auto own = std::ranges::find(devices, 0x01100000U, &LibusbDevice::location);
    ASSERT_NE(own, devices.end());
    const auto other = (*own)->open(error);
    ASSERT_TRUE(other) << error;
    ASSERT_EQ(libusb_set_auto_detach_kernel_driver(other.get(), 1), 0);
    ASSERT_EQ(libusb_claim_interface(other.get(), 0), 0);
    ASSERT_EQ(port.driver(0), "usbfs");
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_NE(status, 0);
    EXPECT_EQ(port.driver(0), "usbfs");
    EXPECT_THAT(port.printer().received(), IsEmpty());
    EXPECT_THAT(fakes.log.lines().at(0), HasSubstr("in use"));
}

TEST_F(KernelOptionSelection, EndsAtOnceWhenThePrinterIsUnpluggedMeanwhile) {
    std::optional<VhciPort> port(postScriptModel());
    std::thread unplugger([&] {
        port->printer().receives("product ==");
        port.reset();
    });
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_LT(std::chrono::steady_clock::now() - start, UsbOptionSelection::kAnswerLimit);
    unplugger.join();
}

}  // namespace
}  // namespace ventras
