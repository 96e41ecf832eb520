#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/agent/Agent.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using Names = std::vector<std::string>;

constexpr int kNoDevice = 255;
constexpr int kNoPermission = 77;
const std::string kDeprecated = "Deprecated or unsupports options...\n";

class CommandLine : public testing::Test {
protected:
    std::string defaultPrinter() const {
        return runProgram({"lpstat", "-d"}, {.environment = scheduler_.environment()}).standardOutput;
    }

    PrivateScheduler scheduler_;
    Agent agent_{scheduler_};
    ScriptedPrinter printer_{{.name = "Office"}};
};

struct IdleCase {
    const char* what;
    Names arguments;
    std::string standardError;
};

TEST_F(CommandLine, WithoutADeviceEndsWith255) {
    const IdleCase cases[] = {
        {"nothing at all", {}, ""},
        {"an empty argument", {""}, ""},
        {"no known form",
         {"printer", "http://127.0.0.1/", "socket://127.0.0.1", "IPP://127.0.0.1/", "--help"},
         ""},
        {"deprecated options", {"-b", "-target", "-d"}, kDeprecated + kDeprecated + kDeprecated},
        {"downloads off", {"--download"}, ""},
        {"the skerrow mode", {"--skerrow"}, ""},
        {"a location where nothing is", {"-u0x7f123456"}, ""},
        {"an empty scanner description", {"-s"}, ""},
    };
    for (const auto& [what, arguments, standardError] : cases) {
        const auto run = agent_.run(arguments);
        EXPECT_EQ(run.exitStatus, kNoDevice) << what << '\n' << run.story();
        EXPECT_EQ(run.standardOutput, "") << what;
        EXPECT_EQ(run.standardError, standardError) << what;
    }
    EXPECT_EQ(scheduler_.queues(), Names{});
}

TEST_F(CommandLine, SaysWhatItDoesAndWhichQueueItMade) {
    const auto run = agent_.run({printer_.uri()});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, "INFO:Determining printer's features...\nQueue ID:Office\n");
    EXPECT_EQ(run.standardError, "");
}

TEST_F(CommandLine, GoesOnAfterDeprecatedOptions) {
    const auto run = agent_.run({"-b", printer_.uri(), "-t"});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.standardError, kDeprecated + kDeprecated);
    EXPECT_EQ(run.queueID(), "Office");
}

TEST_F(CommandLine, IgnoresWhatItDoesNotKnow) {
    const auto run = agent_.run({"--verbose", printer_.uri(), "ftp://127.0.0.1/", "--download"});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.standardError, "");
    EXPECT_EQ(run.queueID(), "Office");
}

TEST_F(CommandLine, MakesTheFirstQueueTheDefault) {
    const ScriptedPrinter second({.name = "Second"});
    ASSERT_EQ(agent_.run({printer_.uri()}).exitStatus, 0);
    EXPECT_THAT(defaultPrinter(), HasSubstr(": Office"));
    ASSERT_EQ(agent_.run({second.uri()}).exitStatus, 0);
    EXPECT_EQ(scheduler_.queues(), (Names{"Office", "Second"}));
    EXPECT_THAT(defaultPrinter(), HasSubstr(": Office"));
}

TEST_F(CommandLine, KeepsItsLogOffAStreamThatNobodyKeeps) {
    agent_.leaveJournal();
    const auto run = agent_.run({"ipp://127.0.0.1:" + std::to_string(freePort()) + "/ipp/print"});
    EXPECT_EQ(run.exitStatus, kNoDevice);
    EXPECT_EQ(run.standardError, "");
}

TEST_F(CommandLine, DoesNothingWithoutTheRightToAdministerPrinters) {
    // An ordinary user on a scheduler that does not show whose it is, and no service to ask for the right.
    const PrivateScheduler scheduler({.listensOnTcp = true, .user = ordinaryUser()});
    const Agent agent(scheduler);
    const auto run = agent.run({"-b", printer_.uri()});
    EXPECT_EQ(run.exitStatus, kNoPermission) << run.story();
    EXPECT_EQ(run.standardOutput, "");
    EXPECT_EQ(run.standardError, "");
    EXPECT_EQ(printer_.connectionCount(), 0U);
    EXPECT_EQ(scheduler.queues(), Names{});
}

}  // namespace
}  // namespace ventras
