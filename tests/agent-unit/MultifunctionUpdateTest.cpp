#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "tests/agent-unit/Round.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

constexpr std::string_view kPrinterUUID =
    "12345678-9abc-def0-1234-56789abcdef0";  // of every scripted printer
const std::string kPPD = "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*ModelName: \"Laser\"\n";

ImageDevice networkScanner(std::string uuid, std::string_view printerUUID = kPrinterUUID) {
    const auto item = "UUID=" + std::string(printerUUID);
    ImageDevice device;
    device.transport = ImageDeviceTransport::kTCPIP;
    device.txtRecord = static_cast<char>(item.size()) + item;
    device.uuidString = std::move(uuid);
    return device;
}

class MultifunctionUpdate : public Round {
protected:
    MultifunctionUpdate() { fake_.printSystem.queuePPDs = {{"Scripted", kPPD}, {"old", kPPD}}; }

    using Updates = std::vector<std::pair<std::string, std::string>>;  // queue and its new PPD
    const Updates& updates() const { return fake_.printSystem.setPPDs; }

    ScriptedPrinter printer_;
};

TEST_F(MultifunctionUpdate, WritesTheScannerIntoTheNewQueueOfItsPrinter) {
    fake_.imageDevices.devices = {networkScanner("scanner-1")};
    fake_.imageDevices.devices[0].modulePath = "/lib/x.so";
    EXPECT_EQ(run({printer_.uri()}), 0);
    EXPECT_EQ(updates(), Updates{});  // only when the run is over
    controller_.updateMFPs();
    EXPECT_EQ(updates(), (Updates{{"Scripted", kPPD + "*QLScannerUUID: \"scanner-1\"\n"
                                                      "*QLScannerModulePath: \"/lib/x.so\"\n"
                                                      "*QLICADriver: \"True\"\n\n"}}));
}

TEST_F(MultifunctionUpdate, WritesTheScannerIntoAQueueThatWasThereBefore) {
    addQueue("old", printer_.uri());
    fake_.imageDevices.devices = {networkScanner("scanner-1")};
    EXPECT_EQ(run({printer_.uri()}), 0);
    controller_.updateMFPs();
    EXPECT_EQ(updates(),
              (Updates{{"old", kPPD + "*QLScannerUUID: \"scanner-1\"\n*QLICADriver: \"True\"\n\n"}}));
}

TEST_F(MultifunctionUpdate, TakesTheFirstScannerThatIsTheSameDevice) {
    fake_.imageDevices.devices = {networkScanner("another", "99"), networkScanner("first"),
                                  networkScanner("second")};
    EXPECT_EQ(run({printer_.uri()}), 0);
    controller_.updateMFPs();
    ASSERT_EQ(updates().size(), 1U);
    EXPECT_NE(updates()[0].second.find("\"first\""), std::string::npos) << updates()[0].second;
}

TEST_F(MultifunctionUpdate, LeavesPrintersWithoutAScannerAlone) {
    fake_.imageDevices.devices = {networkScanner("another", "99")};
    EXPECT_EQ(run({printer_.uri()}), 0);
    controller_.updateMFPs();
    EXPECT_EQ(updates(), Updates{});
}

TEST_F(MultifunctionUpdate, LeavesPrintersAloneThatGotNoQueue) {
    fake_.printSystem.create = [](const auto&) { return 73; };
    fake_.imageDevices.devices = {networkScanner("scanner-1")};
    EXPECT_EQ(run({printer_.uri()}), 0);
    controller_.updateMFPs();
    EXPECT_EQ(updates(), Updates{});
}

TEST_F(MultifunctionUpdate, DoesNothingForAScannerWithoutAUUID) {
    fake_.imageDevices.devices = {networkScanner("")};
    EXPECT_EQ(run({printer_.uri()}), 0);
    controller_.updateMFPs();
    EXPECT_EQ(updates(), Updates{});
}

TEST_F(MultifunctionUpdate, UpdatesEachPrinterOnce) {
    const ScriptedPrinter other({.name = "Other", .edit = [](ipp_t* answer) {
                                     setAttribute(answer, IPP_TAG_URI, "printer-uuid", "urn:uuid:99");
                                 }});
    fake_.imageDevices.devices = {networkScanner("of the other", "99"), networkScanner("of the first")};
    EXPECT_EQ(run({printer_.uri(), other.uri()}), 0);
    controller_.updateMFPs();
    auto queues = updates();
    std::ranges::sort(queues);
    ASSERT_EQ(queues.size(), 2U);
    EXPECT_EQ(queues[0].first, "Other");
    EXPECT_NE(queues[0].second.find("\"of the other\""), std::string::npos);
    EXPECT_EQ(queues[1].first, "Scripted");
    EXPECT_NE(queues[1].second.find("\"of the first\""), std::string::npos);
}

TEST_F(MultifunctionUpdate, IsHarmlessBeforeAnyRound) {
    controller_.updateMFPs();
    EXPECT_EQ(updates(), Updates{});
}

}  // namespace
}  // namespace ventras
