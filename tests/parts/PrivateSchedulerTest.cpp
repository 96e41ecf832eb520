#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <thread>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/PrivateScheduler.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::Test;

const std::string kColourDuplex = readFile(testDocument("colour-duplex.ppd"));

struct SchedulerCase {
    const char* name;
    bool ordinary;
    bool tcp;
};

void PrintTo(const SchedulerCase& row, std::ostream* out) {
    *out << row.name;
}

class Schedulers : public testing::TestWithParam<SchedulerCase> {
protected:
    PrivateScheduler scheduler_{SchedulerOptions{
        .listensOnTcp = GetParam().tcp, .user = GetParam().ordinary ? ordinaryUser() : std::nullopt}};
};

INSTANTIATE_TEST_SUITE_P(All, Schedulers,
                         testing::Values(SchedulerCase{"RootOnSocket", false, false},
                                         SchedulerCase{"RootOnTcp", false, true},
                                         SchedulerCase{"OrdinaryUserOnSocket", true, false},
                                         SchedulerCase{"OrdinaryUserOnTcp", true, true}),
                         [](const auto& test) { return test.param.name; });

TEST_P(Schedulers, KeepsQueues) {
    EXPECT_EQ(scheduler_.queues(), std::vector<std::string>{});
    scheduler_.addQueue("Second", "ippusb://Name._ipp._tcp.local./?uuid=1", kColourDuplex);
    scheduler_.addQueue("First", "usb://Acme/ColorJet?serial=1", kColourDuplex);
    EXPECT_EQ(scheduler_.queues(), (std::vector<std::string>{"First", "Second"}));
    EXPECT_EQ(scheduler_.attribute("First", "device-uri"), "usb://Acme/ColorJet?serial=1");
    EXPECT_EQ(scheduler_.attribute("First", "printer-make-and-model"), "Acme ColorJet, 1.0");
    EXPECT_EQ(scheduler_.attribute("First", "printer-state"), "3");
    EXPECT_EQ(scheduler_.ppd("First"), kColourDuplex);
    scheduler_.deleteQueue("First");
    EXPECT_EQ(scheduler_.queues(), std::vector<std::string>{"Second"});
    EXPECT_TRUE(scheduler_.attributes("First").empty());
    EXPECT_EQ(scheduler_.ppd("First"), "");
}

TEST_P(Schedulers, PrintsIntoAFile) {
    scheduler_.addQueue("Usb", "usb://Acme/ColorJet", kColourDuplex);
    const int job = scheduler_.print("Usb", "hello.txt", {"raw"});
    const auto sink = scheduler_.sinkFile("Usb", job);
    ASSERT_TRUE(PrivateScheduler::appears(sink)) << scheduler_.errorLog();
    EXPECT_EQ(readFile(sink), readFile(testDocument("hello.txt")));
}

TEST_P(Schedulers, ServesOtherProgramsThroughTheirEnvironment) {
    scheduler_.addQueue("Only", "usb://Acme/ColorJet");
    const auto lpstat = runProgram({"lpstat", "-e"}, {.environment = scheduler_.environment()});
    EXPECT_EQ(lpstat.standardOutput, "Only\n") << lpstat.standardError;
}

TEST_P(Schedulers, ServesThisProcess) {
    scheduler_.addQueue("Mine", "usb://Acme/ColorJet");
    scheduler_.setDefault("Mine");
    const UseScheduler use(scheduler_);
    const auto defaultHere = std::string(cupsGetDefault());
    std::string defaultElsewhere;
    std::thread([&] { defaultElsewhere = cupsGetDefault(); }).join();
    EXPECT_EQ(defaultHere, "Mine");
    EXPECT_EQ(defaultElsewhere, "Mine");
}

TEST_P(Schedulers, ComesBackWithItsQueues) {
    scheduler_.addQueue("Kept", "usb://Acme/ColorJet");
    scheduler_.stop();
    EXPECT_THROW(scheduler_.queues(), std::runtime_error);
    scheduler_.start();
    EXPECT_EQ(scheduler_.queues(), std::vector<std::string>{"Kept"});
}

TEST_P(Schedulers, FreezesAndThaws) {
    scheduler_.addQueue("Cold", "usb://Acme/ColorJet");
    scheduler_.suspend();
    const auto frozen = runProgram({"lpstat", "-e"}, {.environment = scheduler_.environment()}, 300ms);
    EXPECT_TRUE(frozen.timedOut) << frozen.standardOutput;
    scheduler_.resume();
    const auto thawed = runProgram({"lpstat", "-e"}, {.environment = scheduler_.environment()}, 10s);
    EXPECT_EQ(thawed.standardOutput, "Cold\n");
}

TEST_P(Schedulers, DiesWhenKilled) {
    const auto pid = scheduler_.pid();
    scheduler_.kill();
    EXPECT_EQ(::kill(pid, 0), -1);
}

TEST_P(Schedulers, WritesRequestsDown) {
    EXPECT_EQ(scheduler_.queues(), std::vector<std::string>{});
    scheduler_.stop();
    EXPECT_NE(scheduler_.accessLog().find("CUPS-Get-Printers"), std::string::npos) << scheduler_.accessLog();
}

TEST(PrivateScheduler, RunsAsTheUserThatWasAskedFor) {
    const PrivateScheduler own;
    const PrivateScheduler ordinary({.user = ordinaryUser()});
    const auto userOf = [](const PrivateScheduler& scheduler) {
        struct stat status {};
        stat(("/proc/" + std::to_string(scheduler.pid())).c_str(), &status);
        return status.st_uid;
    };
    EXPECT_EQ(userOf(own), getuid());
    EXPECT_EQ(userOf(ordinary), ordinaryUser().value_or(getuid()));
    EXPECT_NE(userOf(ordinary), 0U);
}

TEST(PrivateScheduler, StartsWithinMilliseconds) {
    const auto begin = std::chrono::steady_clock::now();
    const PrivateScheduler scheduler;
    // 15 ms on an idle machine.
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 2s);
}

TEST(PrivateScheduler, RefusesAdditionsWhenToldTo) {
    const PrivateScheduler scheduler({.policy = SchedulerPolicy::refusesAdditions});
    EXPECT_THROW(scheduler.addQueue("No", "usb://Acme/ColorJet", kColourDuplex), std::runtime_error);
    EXPECT_EQ(scheduler.queues(), std::vector<std::string>{});
}

TEST(PrivateScheduler, KnowsItsAdministratorsUnderTheStockPolicy) {
    // Each scheduler's administrators are the group of the user that it runs as; the socket tells who calls.
    const auto addTo = [](const PrivateScheduler& scheduler, std::optional<uid_t> user) {
        return runProgram({"lpadmin", "-p", "New", "-E", "-v", "usb://Acme/ColorJet"},
                          {.environment = scheduler.environment(), .user = user}, 10s);
    };
    const PrivateScheduler ordinary({.policy = SchedulerPolicy::stock, .user = ordinaryUser()});
    const auto allowed = addTo(ordinary, ordinaryUser());
    EXPECT_EQ(allowed.exitStatus, 0) << allowed.standardError;
    EXPECT_EQ(ordinary.queues(), std::vector<std::string>{"New"});

    const PrivateScheduler own({.policy = SchedulerPolicy::stock});
    if (const auto stranger = ordinaryUser()) {
        EXPECT_NE(addTo(own, stranger).exitStatus, 0);
        EXPECT_EQ(own.queues(), std::vector<std::string>{});
    }
}

TEST(PrivateScheduler, HasTheBackendsItWasGiven) {
    const PrivateScheduler scheduler(
        {.backends = {
             {"failing", "#!/bin/sh\n[ $# -eq 0 ] && exit 0\necho 'ERROR: out of paint' >&2\nexit 1\n"}}});
    scheduler.addQueue("Broken", "failing://x");
    scheduler.print("Broken", "hello.txt");
    comesTrue([&] { return scheduler.attribute("Broken", "printer-state") == "5"; }, 5s);
    EXPECT_EQ(scheduler.attribute("Broken", "printer-state"), "5") << scheduler.errorLog();
    EXPECT_THROW(scheduler.addQueue("Unknown", "nosuchscheme://x"), std::runtime_error);
}

TEST(PrivateScheduler, HasTheDriversItWasGivenAndNoOthers) {
    const PrivateScheduler scheduler({.models = {{{"acme.ppd", kColourDuplex}}}});
    const auto drivers =
        runProgram({"lpinfo", "--include-schemes", "file", "-m"}, {.environment = scheduler.environment()});
    EXPECT_NE(drivers.standardOutput.find("acme.ppd Acme ColorJet, 1.0"), std::string::npos)
        << drivers.standardOutput;
    const auto others =
        runProgram({"lpinfo", "--include-schemes", "drv", "-m"}, {.environment = scheduler.environment()});
    EXPECT_EQ(others.standardOutput.find("drv:"), std::string::npos) << others.standardOutput;
}

TEST(PrivateScheduler, StartsWithPrintersFromAFile) {
    const PrivateScheduler scheduler({.printers =
                                          "<Printer Old>\nDeviceURI usb://Acme/Old\nState Idle\nAccepting "
                                          "Yes\nJobSheets none none\nOpPolicy default\n</Printer>\n"});
    EXPECT_EQ(scheduler.queues(), std::vector<std::string>{"Old"});
}

TEST(UseScheduler, CanPointWhereNobodyIs) {
    const UseScheduler use("/nonexistent/socket");
    EXPECT_EQ(cupsGetDefault(), nullptr);
}

}  // namespace
}  // namespace ventras
