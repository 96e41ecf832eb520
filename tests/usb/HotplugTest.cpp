#include <fnmatch.h>
#include <gmock/gmock.h>

#include <fstream>
#include <string>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;

/// What the helper would start for a device, with "echo" in the agent's place.
ProgramResult startFor(const std::string& systemPath) {
    return runProgram({VENTRAS_HOTPLUG_PROGRAM, systemPath, "/bin/echo", "--skerrow"});
}

TEST(Hotplug, StartsTheAgentForEachPrinterInterfaceInDecimal) {
    UsbBench bench;
    bench.plugIn("2-1.3.2",
                 {.settings = {{0, 0, 7, 1, 2}, {1, 0, 0xFF, 0, 0}, {2, 0, 0xFF, 0, 0}, {2, 1, 7, 1, 4}}});
    bench.plugIn("1-4");
    const auto run = startFor(bench.sysPath("2-1.3.2"));
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, "--skerrow -u34807808,0 -u34807808,2\n");
    EXPECT_EQ(bench.node("2-1.3.2").timesOpened(), 0);
}

TEST(Hotplug, StartsNothingForADeviceThatIsNoPrinterOrGone) {
    UsbBench bench;
    bench.plugIn("1-1", {.settings = {{0, 0, 8, 6, 80}}});
    bench.plugIn("1-2");
    const auto gone = bench.sysPath("1-2");
    bench.unplug("1-2");
    for (const auto& path : {bench.sysPath("1-1"), gone, std::string("/sys"), std::string("")}) {
        const auto run = startFor(path);
        EXPECT_EQ(run.exitStatus, 0) << path;
        EXPECT_THAT(run.standardOutput, IsEmpty()) << path;
    }
}

TEST(Hotplug, SaysWhatIsWrong) {
    UsbBench bench;
    bench.plugIn("1-1");
    EXPECT_EQ(runProgram({VENTRAS_HOTPLUG_PROGRAM}).exitStatus, 2);
    EXPECT_EQ(runProgram({VENTRAS_HOTPLUG_PROGRAM, bench.sysPath("1-1")}).exitStatus, 2);
    const auto run = runProgram({VENTRAS_HOTPLUG_PROGRAM, bench.sysPath("1-1"), "/no/such/program"});
    EXPECT_EQ(run.exitStatus, 127);
    EXPECT_THAT(run.standardError, HasSubstr("/no/such/program"));
}

/// The pattern that a match key of the udev rule compares with.
std::string rulePattern(const std::string& key) {
    const auto rules = readFile(VENTRAS_UDEV_RULES);
    const auto begin = rules.find(key + "==\"") + key.size() + 3;
    return rules.substr(begin, rules.find('"', begin) - begin);
}

TEST(HotplugRule, MatchesDevicesWithAPrinterInterfaceInAnySetting) {
    const auto pattern = rulePattern("ENV{ID_USB_INTERFACES}");
    for (const auto* interfaces : {":070102:", ":ff0000:070104:", ":080650:070101:ff0104:"})
        EXPECT_EQ(fnmatch(pattern.c_str(), interfaces, 0), 0) << interfaces;
    for (const auto* interfaces : {":080650:", ":070202:", ":ff0701:", "::", ""})
        EXPECT_NE(fnmatch(pattern.c_str(), interfaces, 0), 0) << interfaces;
}

}  // namespace
}  // namespace ventras
