#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>

#include "tests/parts/Program.h"
#include "tests/parts/SchedulerFolder.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

TEST(Environment, OfSeveralPartsHasTheFirstOfEachName) {
    const Environment all{{"A", "1"}, {"B", "2"}, {"C", "4"}};
    EXPECT_EQ(together({{{"A", "1"}, {"B", "2"}}, {}, {{"B", "3"}, {"C", "4"}}}), all);
}

TEST(Program, TellsStatusOutputAndErrorsApart) {
    const auto run = runProgram({"sh", "-c", "echo out; echo err >&2; exit 7"});
    EXPECT_EQ(run.exitStatus, 7);
    EXPECT_EQ(run.signal, 0);
    EXPECT_EQ(run.standardOutput, "out\n");
    EXPECT_EQ(run.standardError, "err\n");
    EXPECT_FALSE(run.timedOut);
    EXPECT_GT(run.peakKilobytes, 0);
}

TEST(Program, TellsTheSignalThatEndedIt) {
    const auto run = runProgram({"sh", "-c", "kill -SEGV $$"});
    EXPECT_EQ(run.exitStatus, -1);
    EXPECT_EQ(run.signal, SIGSEGV);
}

TEST(Program, GetsItsInputEnvironmentAndFolder) {
    const TemporaryFolder folder;
    const auto run = runProgram(
        {"sh", "-c", "cat; echo \"$COLOUR\"; pwd"},
        {.environment = {{"COLOUR", "blue"}}, .standardInput = "first\n", .workingFolder = folder.path()});
    EXPECT_EQ(run.standardOutput, "first\nblue\n" + folder.path().string() + "\n");
}

TEST(Program, KeepsOutputLargerThanAnyPipe) {
    const auto run = runProgram({"head", "-c", "3000000", "/dev/zero"});
    EXPECT_EQ(run.standardOutput.size(), 3'000'000U);
}

TEST(Program, IsEndedWhenItsTimeIsUp) {
    const auto run = runProgram({"sleep", "60"}, {}, 100ms);
    EXPECT_TRUE(run.timedOut);
    EXPECT_EQ(run.signal, SIGTERM);
    EXPECT_GE(run.wallTime, 100ms);
    EXPECT_LT(run.wallTime, 5s);
}

TEST(Program, IsKilledWhenItDoesNotListen) {
    const auto run = runProgram({"sh", "-c", "trap '' TERM; while :; do sleep 1; done"}, {}, 100ms);
    EXPECT_TRUE(run.timedOut);
    EXPECT_EQ(run.signal, SIGKILL);
}

TEST(Program, RunsAsAnOrdinaryUser) {
    const auto user = ordinaryUser();
    const auto run = runProgram({"id", "-u"}, {.user = user});
    EXPECT_EQ(run.standardOutput, std::to_string(user.value_or(getuid())) + "\n");
    EXPECT_NE(run.standardOutput, "0\n");
}

TEST(Program, InheritsNoDescriptorOfTheTest) {
    // ls has the folder that it lists open as its fourth.
    EXPECT_EQ(runProgram({"ls", "/proc/self/fd"}).standardOutput, "0\n1\n2\n3\n");
}

TEST(Program, KnowsItsJournal) {
    const auto run = runProgram({"sh", "-c", "echo $JOURNAL_STREAM; stat -L -c %d:%i /dev/stderr"},
                                {.errorsGoToJournal = true});
    const auto half = run.standardOutput.size() / 2;
    EXPECT_GT(half, 2U);
    EXPECT_EQ(run.standardOutput.substr(0, half), run.standardOutput.substr(half));
}

TEST(Program, EndsWithItsOwner) {
    pid_t pid = 0;
    {
        RunningProgram program({"sleep", "60"});
        pid = program.pid();
        EXPECT_TRUE(program.isRunning());
    }
    EXPECT_EQ(kill(pid, 0), -1);
}

TEST(TemporaryFolder, IsShortAndGoneAfterwards) {
    std::filesystem::path path;
    {
        const TemporaryFolder folder;
        path = folder.path();
        const auto file = folder.write("deep/er/file", "content");
        EXPECT_EQ(readFile(file), "content");
        EXPECT_LT(path.string().size(), 80U);
    }
    EXPECT_FALSE(std::filesystem::exists(path));
}

}  // namespace
}  // namespace ventras
