#include <gtest/gtest.h>

#include <filesystem>

#include "tests/ctl/Answers.h"
#include "tests/ctl/Ctl.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

constexpr auto kDeviceID = "MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;";

class CtlUsb : public testing::Test {
protected:
    CtlUsb() {
        // Drivers under such a name count as installed on this computer.
        const auto collections = scheduler_.folder() / "data/drv/Library";
        std::filesystem::create_directories(collections);
        std::filesystem::copy("/usr/share/cups/drv/sample.drv", collections);
        bench_.plugIn("1-4", {.vendor = 1008, .product = 7, .deviceID = kDeviceID});
        bench_.node("1-4").bindDriver(0, "usblp");
    }

    ProgramResult run(std::vector<std::string> arguments) {
        return ctl(std::move(arguments),
                   {.environment = together({scheduler_.environment(), bench_.environment()})});
    }

    UsbBench bench_;
    PrivateScheduler scheduler_{{.models = {{}}}};
};

TEST_F(CtlUsb, ListsThePrinterInterfacesThatAreAttached) {
    const auto listed = run({"usb", "--json"});
    EXPECT_EQ(listed.exitStatus, 0) << listed.standardError;
    EXPECT_EQ(listed.standardOutput,
              R"([{"location":20971520,"interfaceNumber":0,"vendorID":1008,"productID":7,)"
              R"("deviceID":"MFG:HP;MDL:HP LaserJet;CMD:PCL;SN:C4;","listIPPOverUSBInterfaces":null}])"
              "\n");
}

TEST_F(CtlUsb, CountsNoPrinterAmongTheScanners) {
    const auto listed = run({"scanners", "--json"});
    EXPECT_EQ(listed.exitStatus, 0) << listed.standardError;
    EXPECT_TRUE(parseJson(listed.standardOutput)) << listed.standardOutput;
    EXPECT_EQ(listed.standardOutput.find("\"usbVendor\":1008"), std::string::npos) << listed.standardOutput;
}

TEST_F(CtlUsb, PlansTheQueueOfAPrinterAndMakesNone) {
    const auto explained = run({"explain", "--json", "-u20971520,0"});
    EXPECT_EQ(explained.exitStatus, 0) << explained.standardError;
    const auto explanations = objectsIn(explained.standardOutput);
    ASSERT_EQ(explanations.size(), 1U) << explained.standardOutput;
    const auto& explanation = explanations.front();
    EXPECT_EQ(json(explanation, "device"), "\"USBPrinterObject\"");
    EXPECT_EQ(json(explanation, "name"), "\"HP LaserJet\"");
    EXPECT_EQ(json(explanation, "deviceURI"), "\"usb://HP/HP%20LaserJet?serial=C4\"");
    EXPECT_NE(json(explanation, "evidence").find(kDeviceID), std::string::npos) << explained.standardOutput;
    EXPECT_NE(json(explanation, "driverList").find(R"("reason":"the product in its device ID)"),
              std::string::npos)
        << explained.standardOutput;
    EXPECT_EQ(json(explanation, "status"), "0");
    EXPECT_EQ(json(explanation, "packageReason"), "null");
    EXPECT_TRUE(json(explanation, "createQueue").starts_with(R"([{"queueID":"HP_LaserJet",)"))
        << explained.standardOutput;
    EXPECT_TRUE(scheduler_.queues().empty());
}

TEST_F(CtlUsb, SaysThatNoDriverFits) {
    bench_.plugIn("1-5", {.deviceID = "MFG:Nobody;MDL:Knows;CMD:X;"});
    const auto explained = run({"explain", "--json", "-u22020096,0"});
    EXPECT_EQ(explained.exitStatus, 0) << explained.standardError;
    const auto explanations = objectsIn(explained.standardOutput);
    ASSERT_EQ(explanations.size(), 1U) << explained.standardOutput;
    EXPECT_EQ(json(explanations.front(), "driverList"), "[]");
    EXPECT_EQ(json(explanations.front(), "status"), "241");
    EXPECT_EQ(json(explanations.front(), "driverPackage"), "null");
    EXPECT_EQ(json(explanations.front(), "packageReason"), "\"no package in the catalogue is for it\"");
}

TEST_F(CtlUsb, SaysWhichPackageWouldBeOffered) {
    bench_.plugIn("1-5", {.deviceID = "MFG:Brother;MDL:HL-L2300D series;CMD:PJL,HBP;"});
    const auto explained = run({"explain", "--json", "-u22020096,0"});
    const auto explanations = objectsIn(explained.standardOutput);
    ASSERT_EQ(explanations.size(), 1U) << explained.standardOutput;
    EXPECT_EQ(json(explanations.front(), "status"), "241") << explained.standardOutput;
    EXPECT_EQ(json(explanations.front(), "driverPackage"), "\"printer-driver-brlaser\"");
    EXPECT_TRUE(json(explanations.front(), "packageReason").starts_with("\"it is "))
        << explained.standardOutput;
}

}  // namespace
}  // namespace ventras
