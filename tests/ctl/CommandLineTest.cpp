#include <gtest/gtest.h>

#include "tests/ctl/Ctl.h"

namespace ventras {
namespace {

const std::string kCommands[] = {"device-id", "txt",    "ppd",     "kind",     "match",
                                 "drivers",   "queues", "name",    "printer",  "service",
                                 "explain",   "usb",    "scanner", "scanners", "predicate"};

TEST(CtlCommandLine, ShowsItsCommandsOnDemand) {
    const auto run = ctl({"--help"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardError, "");
    for (const auto& command : kCommands)
        EXPECT_NE(run.standardOutput.find("\n  " + command + " "), std::string::npos) << command;
}

TEST(CtlCommandLine, ShowsEachCommandsUsageOnDemand) {
    for (const auto& command : kCommands) {
        const auto run = ctl({command, "--help"});
        EXPECT_EQ(run.exitStatus, 0) << command;
        EXPECT_TRUE(run.standardOutput.starts_with("Usage: ventrasctl " + command)) << run.standardOutput;
    }
}

TEST(CtlCommandLine, ShowsItsVersion) {
    const auto run = ctl({"--version"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_TRUE(run.standardOutput.starts_with("ventrasctl ")) << run.standardOutput;
}

TEST(CtlCommandLine, RefusesWhatItDoesNotKnow) {
    const std::vector<std::vector<std::string>> kWrong = {
        {}, {"no-such-command"}, {"--no-such-option"}, {"device-id", "--no-such-option"}, {"device-id"},
    };
    for (const auto& arguments : kWrong) {
        const auto run = ctl(arguments);
        EXPECT_EQ(run.exitStatus, 2) << (arguments.empty() ? "" : arguments.back());
        EXPECT_EQ(run.standardOutput, "");
        EXPECT_TRUE(run.standardError.starts_with("ventrasctl: ")) << run.standardError;
    }
}

TEST(CtlCommandLine, TakesOptionsOnEitherSideOfTheCommandAndOfItsOperands) {
    const auto expected = ctl({"device-id", "--json", "MFG:HP"}).standardOutput;
    EXPECT_TRUE(expected.starts_with("{")) << expected;
    EXPECT_EQ(ctl({"--json", "device-id", "MFG:HP"}).standardOutput, expected);
    EXPECT_EQ(ctl({"device-id", "MFG:HP", "--json"}).standardOutput, expected);
    EXPECT_EQ(ctl({"device-id", "--js", "MFG:HP"}).standardOutput, expected);
}

TEST(CtlCommandLine, TakesAnOperandThatLooksLikeAnOption) {
    const auto run = ctl({"device-id", "--json", "--", "--json"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(run.standardOutput.find(R"("dictionaryValue":{"--json":""})"), std::string::npos)
        << run.standardOutput;
}

TEST(CtlCommandLine, KeepsTerminalControlsOutOfItsMessages) {
    const auto run = ctl({"\x1B[2J\xFF"});
    EXPECT_EQ(run.exitStatus, 2);
    EXPECT_EQ(run.standardError.find('\x1B'), std::string::npos) << run.standardError;
    EXPECT_EQ(run.standardError.find('\xFF'), std::string::npos) << run.standardError;
}

TEST(CtlCommandLine, NoticesThatItsOutputIsLost) {
    const auto run = runProgram({"sh", "-c", "exec \"$0\" device-id MFG:HP >/dev/full", VENTRAS_TEST_CTL});
    EXPECT_NE(run.exitStatus, 0);
    EXPECT_EQ(run.standardError, "ventrasctl: the output could not be written\n");
}

}  // namespace
}  // namespace ventras
