#include <gtest/gtest.h>

#include "ctl/Json.h"
#include "tests/ctl/Ctl.h"
#include "tests/parts/PrivateScheduler.h"

namespace ventras {
namespace {

constexpr auto kNoOne = "localhost:1";

ProgramResult ctlAt(const PrivateScheduler& scheduler, std::vector<std::string> arguments,
                    const std::string& input = "") {
    return ctl(std::move(arguments), {.environment = scheduler.environment(), .standardInput = input});
}

ProgramResult ctlWithoutScheduler(std::vector<std::string> arguments) {
    return ctl(std::move(arguments), {.environment = {{"CUPS_SERVER", kNoOne}}});
}

TEST(CtlWithoutScheduler, SaysThatNobodyAnswers) {
    const std::vector<std::vector<std::string>> kCommands = {
        {"drivers", "--json"}, {"match", "--json", "--model", "x"}, {"queues", "--json"}};
    for (const auto& arguments : kCommands) {
        const auto run = ctlWithoutScheduler(arguments);
        EXPECT_EQ(run.exitStatus, 3) << arguments.front();
        EXPECT_EQ(run.standardOutput, "") << arguments.front();
        EXPECT_TRUE(run.standardError.starts_with("ventrasctl: the print scheduler does not answer"))
            << run.standardError;
    }
}

TEST(NameCommand, KnowsNoQueueNameWithoutAScheduler) {
    const auto run = ctlWithoutScheduler({"name", "--json", "Acme X [1A2B3C]"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, R"({"stripped":"Acme X","queueName":null,"displayName":null})"
                                  "\n");
}

TEST(NameCommand, SuggestsWhatNoQueueHas) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("Acme_X", "ipp://localhost:1/ipp/print");
    EXPECT_EQ(ctlAt(scheduler, {"name", "--json", "Acme Y"}).standardOutput,
              R"({"stripped":"Acme Y","queueName":"Acme_Y","displayName":"Acme Y"})"
              "\n");
    EXPECT_EQ(ctlAt(scheduler, {"name", "--json", "--strip", "Acme X [1A2B3C]"}).standardOutput,
              R"({"stripped":"Acme X","queueName":"Acme_X_2","displayName":"Acme X 2"})"
              "\n");
}

TEST(NameCommand, KeepsTheTagUnlessToldToStripIt) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"name", "--json", "Acme X [1A2B3C]"});
    EXPECT_NE(run.standardOutput.find(R"("displayName":"Acme X [1A2B3C]")"), std::string::npos)
        << run.standardOutput;
}

TEST(NameCommand, AnswersLineByLine) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"name", "-"}, "Acme Y\nAcme Z\n");
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, R"({"stripped":"Acme Y","queueName":"Acme_Y","displayName":"Acme Y"})"
                                  "\n"
                                  R"({"stripped":"Acme Z","queueName":"Acme_Z","displayName":"Acme Z"})"
                                  "\n");
}

TEST(QueuesCommand, ShowsTheQueuesForDevices) {
    const PrivateScheduler scheduler;
    EXPECT_EQ(ctlAt(scheduler, {"queues", "--json"}).standardOutput, "[]\n");
    scheduler.addQueue("Office", "ipp://localhost:1/ipp/print");
    scheduler.addQueue("Raw", "socket://localhost:9100");
    const auto run = ctlAt(scheduler, {"queues", "--json"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_TRUE(run.standardOutput.starts_with(
        R"([{"printer-name":"Office","device-uri":"ipp://localhost:1/ipp/print","printer-type":)"))
        << run.standardOutput;
    EXPECT_EQ(run.standardOutput.find("Raw"), std::string::npos) << run.standardOutput;
    EXPECT_EQ(ctlAt(scheduler, {"queues"}).standardOutput,
              "QUEUE   DEVICE\nOffice  ipp://localhost:1/ipp/print\n");
}

TEST(DriversCommand, ShowsTheSchedulersCatalogue) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"drivers", "--json"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto value = parseJson(run.standardOutput);
    ASSERT_TRUE(value && std::holds_alternative<Array>(*value)) << run.standardOutput;
    for (const auto& driver : std::get<Array>(*value))
        EXPECT_NE(find(std::get<Object>(driver), "ppd_name"), nullptr) << toJson(driver);
}

TEST(MatchCommandOnScheduler, FindsADriverOfItsCatalogue) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"match", "--json", "--model", "Generic PostScript Printer"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardOutput << run.standardError;
    EXPECT_NE(run.standardOutput.find(R"("ppd_name":"drv:///sample.drv/generic.ppd")"), std::string::npos)
        << run.standardOutput;
}

}  // namespace
}  // namespace ventras
