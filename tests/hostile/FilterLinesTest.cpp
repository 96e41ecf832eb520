#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/UsbBench.h"

// A line that a device's text smuggles into a PPD would have the scheduler run a program. The texts of
// scanners that get a queue of their own are tested with them, each rule about filter lines with the rules.

namespace ventras {
namespace {

using testing::HasSubstr;
using namespace std::string_literals;

class FilterLines : public HostileRun {
protected:
    Agent agent_{scheduler_};
};

struct SmuggledCase {
    const char* attribute;
    ipp_tag_t tag;
    int status;
};

void PrintTo(const SmuggledCase& row, std::ostream* out) {
    *out << row.attribute;
}

class SmuggledIn : public FilterLines, public testing::WithParamInterface<SmuggledCase> {};

INSTANTIATE_TEST_SUITE_P(Every, SmuggledIn,
                         testing::Values(SmuggledCase{"printer-dns-sd-name", IPP_TAG_NAME, 65},
                                         SmuggledCase{"printer-make-and-model", IPP_TAG_TEXT, 0},
                                         SmuggledCase{"printer-location", IPP_TAG_TEXT, 0},
                                         SmuggledCase{"printer-uuid", IPP_TAG_URI, 0},
                                         SmuggledCase{"urf-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"media-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"media-default", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"media-type-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"media-source-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"output-bin-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"output-bin-default", IPP_TAG_NAME, 0},
                                         SmuggledCase{"printer-output-tray", IPP_TAG_STRING, 0},
                                         SmuggledCase{"sides-default", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"print-color-mode-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"print-color-mode-default", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"finishing-template-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"print-content-optimize-supported", IPP_TAG_KEYWORD, 0},
                                         SmuggledCase{"printer-more-info", IPP_TAG_URI, 0},
                                         SmuggledCase{"printer-strings-uri", IPP_TAG_URI, 0},
                                         SmuggledCase{"printer-icons", IPP_TAG_URI, 0},
                                         SmuggledCase{"printer-supply-info-uri", IPP_TAG_URI, 0},
                                         SmuggledCase{"printer-device-id", IPP_TAG_TEXT, 0}),
                         [](const auto& test) {
                             std::string name = test.param.attribute;
                             std::erase(name, '-');
                             return name;
                         });

TEST_P(SmuggledIn, AttributeOfAPrinterReachNoPpd) {
    const ScriptedPrinter printer(
        {.name = "Victim",
         .rawAttributes = {{GetParam().tag, GetParam().attribute, std::string(kSmuggled)}}});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, GetParam().status) << run.story();
    EXPECT_EQ(newQueues().size(), GetParam().status == 0 ? 1U : 0U) << run.story();
    expectHarmless(agent_, run);
}

// The make and model of a printer without a name is its name too.
TEST_F(FilterLines, OfAMakeAndModelThatNamesTheQueueAreRefused) {
    const ScriptedPrinter printer({.rawAttributes = {
                                       {IPP_TAG_UNKNOWN, "printer-dns-sd-name", ""},
                                       {IPP_TAG_TEXT, "printer-make-and-model", std::string(kSmuggled)},
                                   }});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, 65) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr(printer.uri()));
    EXPECT_EQ(newQueues(), Names{});
    expectHarmless(agent_, run);
}

TEST_F(FilterLines, OfAStatusMessageAreOneLineInTheLog) {
    const ScriptedPrinter printer(
        {.status = IPP_STATUS_ERROR_BUSY, .statusMessage = std::string(kSmuggled) + "\x1b[31m"});
    const auto run = agent_.run({printer.uri()});
    expectHarmless(agent_, run);
}

// The same on the USB, where drivers come from the scheduler's catalogue, one of them with a command line.
class UsbFilterLines : public HostileRun {
protected:
    UsbFilterLines() : HostileRun({.models = {{}}}) {}

    Environment environment() const { return together({scheduler_.environment(), bench_.environment()}); }

    void plugIn(const std::string& deviceID) {
        FakePrinterModel model;
        model.deviceID = deviceID;
        model.isScanner = true;
        bench_.plugIn("1-4", model);
    }

    static constexpr const char* kPrinter = "-u20971520,0";  // 1-4

    UsbBench bench_;
    Agent agent_{environment(), std::nullopt};
};

struct SmuggledIDCase {
    std::string deviceID;
    int status;
};

TEST_F(UsbFilterLines, OfADeviceIDReachNoPpd) {
    installDriver();
    const std::string smuggled(kSmuggled);
    const SmuggledIDCase cases[] = {
        {"MFG:Acme;MDL:Laser" + smuggled + ";CMD:PCL;SN:1;", 241},  // no driver for such a model
        {"MFG:Acme" + smuggled + ";MDL:Laser;CMD:PCL;SN:2;", 0},    // its URI is too long for a guard
        {"MFG:Acme;MDL:Laser;CMD:PCL;SN:3" + smuggled + ";", 0},
        {"MFG:Acme;MDL:Laser;CMD:PCL" + smuggled + ";SN:4;", 0},
        {"MFG:Acme;MDL:Laser;CMD:PCL;SN:5;DES:" + smuggled + ";", 0},
    };
    for (const auto& [deviceID, status] : cases) {
        plugIn(deviceID);
        const auto run = agent_.run({kPrinter, "--download"});
        EXPECT_EQ(run.exitStatus, status) << deviceID << run.story();
        expectHarmless(agent_, run);
        bench_.unplug("1-4");
    }
    EXPECT_EQ(newQueues().size(), 3U);
}

struct ScannerRecordCase {
    const char* name;
    std::string uuid, module;
};

// The scanner half of a device is recorded in the printer's PPD, behind a driver that runs a command line.
TEST_F(UsbFilterLines, OfAScannerDoNotReachThePpdOfItsPrinter) {
    installDriver();
    plugIn("MFG:Acme;MDL:Laser;CMD:PCL;SN:1;");
    const auto printer = agent_.run({kPrinter});
    ASSERT_EQ(printer.exitStatus, 0) << printer.story();
    const auto ppd = scheduler_.ppd(printer.queueID());
    ASSERT_THAT(ppd, HasSubstr("FoomaticRIPCommandLine: \"gs -q -\""));

    const std::string command = "u\"\n*FoomaticRIPCommandLine: \"evil";
    const ScannerRecordCase cases[] = {
        {"filter lines in the UUID", std::string(kSmuggled), "/module"},
        {"filter lines in the module's path", "u", std::string(kSmuggled)},
        {"a command in the UUID", command, "/module"},
        {"a command in the module's path", "u", command},
        {"a command behind a carriage return", "u\"\r*FoomaticRIPCommandLine: \"evil", "/module"},
        {"a command within a text of several lines", "u\n*FoomaticRIPCommandLine: evil", "/module"},
    };
    for (const auto& [name, uuid, module] : cases) {
        const auto run = agent_.run({"--scanner" + uuid + ",P,Multi,/icon,USB,20971520,1,2322," + module});
        EXPECT_EQ(run.exitStatus, 0) << name << '\n' << run.story();
        EXPECT_EQ(scheduler_.ppd(printer.queueID()), ppd) << name;
        EXPECT_THAT(run.standardError, HasSubstr("keeps its driver")) << name;
        expectHarmless(agent_, run);
    }
}

}  // namespace
}  // namespace ventras
