#include <gtest/gtest.h>

#include "tests/ctl/Answers.h"
#include "tests/ctl/Ctl.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

ProgramResult ctlAt(const PrivateScheduler& scheduler, std::vector<std::string> arguments) {
    return ctl(std::move(arguments), {.environment = scheduler.environment()});
}

std::vector<Object> explained(const ProgramResult& run) {
    return objectsIn(run.standardOutput);
}

TEST(PrinterCommand, ShowsWhatAPrinterSaysOfItself) {
    const VirtualPrinter printer({.make = "Acme", .model = "Laser", .duplex = true});
    const auto run = ctl({"printer", "--json", printer.uri()});
    ASSERT_EQ(run.exitStatus, 0) << run.standardError;
    const auto value = parseJson(run.standardOutput);
    ASSERT_TRUE(value) << run.standardOutput;
    const auto& answers = std::get<Object>(*value);
    EXPECT_EQ(json(answers, "name"), "\"Acme Laser\"");
    EXPECT_NE(json(answers, "pdl").find("\"image/urf\""), std::string::npos) << run.standardOutput;
    EXPECT_NE(json(answers, "urf").find("W8"), std::string::npos) << run.standardOutput;
    EXPECT_EQ(json(std::get<Object>(*find(answers, "attributes")), "Duplex"), "\"T\"");
    EXPECT_EQ(json(std::get<Object>(*find(answers, "driverInfo")), "Printer URI"),
              "\"" + printer.uri() + "\"");
}

TEST(PrinterCommand, SaysThatNobodyAnswers) {
    const auto run = ctl({"printer", "--json", "ipp://localhost:1/ipp/print"});
    EXPECT_EQ(run.exitStatus, 3);
    EXPECT_EQ(run.standardOutput, R"({"attributes":{},"name":null,"urf":null,"pdl":null,"driverInfo":null})"
                                  "\n");
    EXPECT_NE(run.standardError.find("ipp://localhost:1/ipp/print: it cannot be reached"), std::string::npos)
        << run.standardError;
}

TEST(PrinterCommand, WantsOneNetworkURI) {
    EXPECT_EQ(ctl({"printer"}).exitStatus, 2);
    EXPECT_EQ(ctl({"printer", "http://localhost/"}).exitStatus, 2);
    EXPECT_EQ(ctl({"printer", "ipp://a/", "ipp://b/"}).exitStatus, 2);
}

TEST(ServiceCommand, DoesNotFindAServiceThatNobodyRegistered) {
    const auto run = ctl({"service", "--json", "No Such Printer"});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_TRUE(
        run.standardOutput.starts_with(R"({"attributes":{},"name":"No Such Printer","urf":null,"pdl":null,)"))
        << run.standardOutput;
}

TEST(ExplainCommand, PlansTheQueueOfANewPrinterAndMakesNone) {
    const PrivateScheduler scheduler;
    const VirtualPrinter printer({.make = "Acme", .model = "Laser"});
    const auto run = ctlAt(scheduler, {"explain", "--json", printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto explanations = explained(run);
    ASSERT_EQ(explanations.size(), 1U) << run.standardOutput;
    const auto& explanation = explanations.front();
    EXPECT_EQ(json(explanation, "argument"), "\"" + printer.uri() + "\"");
    EXPECT_EQ(json(explanation, "device"), "\"VellumProfilePrinterObject\"");
    EXPECT_EQ(json(explanation, "name"), "\"Acme Laser\"");
    EXPECT_EQ(json(explanation, "queueID"), "null");
    EXPECT_EQ(json(explanation, "status"), "0");
    EXPECT_NE(json(explanation, "driverList").find(R"("kind":1,"reason":)"), std::string::npos)
        << run.standardOutput;
    EXPECT_TRUE(json(explanation, "createQueue")
                    .starts_with(R"([{"queueID":"Acme_Laser","displayName":"Acme Laser",)"))
        << run.standardOutput;
    EXPECT_TRUE(scheduler.queues().empty());
}

TEST(ExplainCommand, NamesTheQueueThatServesAPrinterAndWhy) {
    const PrivateScheduler scheduler;
    const VirtualPrinter printer;
    scheduler.addQueue("Mine", printer.uri());
    const auto run = ctlAt(scheduler, {"explain", "--json", printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto explanations = explained(run);
    ASSERT_EQ(explanations.size(), 1U) << run.standardOutput;
    EXPECT_EQ(json(explanations.front(), "queueID"), "\"Mine\"");
    EXPECT_EQ(json(explanations.front(), "queueReason"),
              "\"its device URI is this device's: " + printer.uri() + "\"");
    EXPECT_EQ(json(explanations.front(), "status"), "242");
    EXPECT_EQ(json(explanations.front(), "createQueue"), "[]");
}

TEST(ExplainCommand, SaysWhyAPrinterCannotBeHandled) {
    const PrivateScheduler scheduler;
    const ScriptedPrinter printer({.edit = [](ipp_t* answer) { removeAttribute(answer, "urf-supported"); }});
    const auto run = ctlAt(scheduler, {"explain", "--json", printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto explanations = explained(run);
    ASSERT_EQ(explanations.size(), 1U) << run.standardOutput;
    EXPECT_EQ(json(explanations.front(), "status"), "255");
    const auto difficulty = json(explanations.front(), "difficulty");
    EXPECT_NE(difficulty.find("image/urf"), std::string::npos) << run.standardOutput;
    EXPECT_EQ(json(explanations.front(), "outcome"), "\"no queue: " + difficulty.substr(1))
        << run.standardOutput;
}

TEST(ExplainCommand, ExplainsEveryArgumentAsTheAgentReadsIt) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(
        scheduler, {"explain", "-d", "--download", "--skerrow", "-u1,0", "--scannerjunk", "what", "--json"});
    EXPECT_EQ(run.exitStatus, 1);
    std::string outcomes;
    for (const auto& explanation : explained(run)) {
        EXPECT_EQ(json(explanation, "device"), "null") << run.standardOutput;
        outcomes += json(explanation, "argument") + ": " + json(explanation, "outcome") + "\n";
    }
    EXPECT_EQ(outcomes,
              "\"-d\": \"an option of old, without effect\"\n"
              "\"--download\": \"missing drivers would not be downloaded\"\n"
              "\"--skerrow\": \"missing drivers would be announced, not offered\"\n"
              "\"-u1,0\": \"no USB printer at this place that tells what it is\"\n"
              "\"--scannerjunk\": \"not the description of a scanner\"\n"
              "\"what\": \"not an argument that the agent knows; ignored\"\n");
}

TEST(ExplainCommand, PlansTheQueueOfAScannerOnly) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"explain", "--json", "--scannerUUID-1,id,Acme Scan,,USB,1,2,3"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto explanations = explained(run);
    ASSERT_EQ(explanations.size(), 1U) << run.standardOutput;
    EXPECT_EQ(json(explanations.front(), "device"), "\"ScannerObject\"");
    EXPECT_EQ(json(explanations.front(), "deviceURI"), "\"usb://UUID-1\"");
    EXPECT_EQ(json(explanations.front(), "status"), "0");
    EXPECT_NE(json(explanations.front(), "createQueue").find(R"("Scanner":true)"), std::string::npos)
        << run.standardOutput;
    EXPECT_TRUE(scheduler.queues().empty());
}

TEST(ExplainCommand, TakesAURIGivenTwiceOnce) {
    const PrivateScheduler scheduler;
    const auto run = ctlAt(scheduler, {"explain", "--json", "ipp://localhost:1/", "ipp://localhost:1/"});
    const auto explanations = explained(run);
    ASSERT_EQ(explanations.size(), 2U) << run.standardOutput;
    EXPECT_EQ(json(explanations[1], "outcome"), "\"given before\"");
}

TEST(ExplainCommand, ListsTheSameForPeople) {
    const PrivateScheduler scheduler;
    const VirtualPrinter printer({.make = "Acme", .model = "Laser"});
    const auto run = ctlAt(scheduler, {"explain", printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    for (const std::string line :
         {"name           Acme Laser\n", "outcome        a queue would be made\n",
          "(it is the driver for all driverless printers)\n", "createQueue    Acme_Laser (Acme Laser)\n"})
        EXPECT_NE(run.standardOutput.find(line), std::string::npos) << line << run.standardOutput;
}

TEST(ExplainCommand, SaysWhenTheSchedulerDoesNotAnswer) {
    const auto run =
        ctl({"explain", "--json", "--download"}, {.environment = {{"CUPS_SERVER", "localhost:1"}}});
    EXPECT_EQ(run.exitStatus, 3);
    EXPECT_EQ(explained(run).size(), 1U) << run.standardOutput;
}

}  // namespace
}  // namespace ventras
