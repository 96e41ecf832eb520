#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

#include "tests/agent/Agent.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Names = std::vector<std::string>;

struct SchedulerCase {
    const char* name;
    bool ordinary;
};

void PrintTo(const SchedulerCase& row, std::ostream* out) {
    *out << row.name;
}

// The whole program, a real scheduler, real printers; as the administrator and as an ordinary user.
class DriverlessPrinter : public testing::TestWithParam<SchedulerCase> {
protected:
    PrivateScheduler scheduler_{
        SchedulerOptions{.user = GetParam().ordinary ? ordinaryUser() : std::nullopt}};
    Agent agent_{scheduler_};
};

INSTANTIATE_TEST_SUITE_P(As, DriverlessPrinter,
                         testing::Values(SchedulerCase{"Administrator", false},
                                         SchedulerCase{"OrdinaryUser", true}),
                         [](const auto& test) { return test.param.name; });

TEST_P(DriverlessPrinter, GetsAQueueThatPrints) {
    const VirtualPrinter printer(
        {.name = "Office", .make = "Acme", .model = "ColorJet", .duplex = true, .colour = true});
    const auto run = agent_.run({printer.uri()});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    ASSERT_EQ(scheduler_.queues(), Names{run.queueID()}) << run.story();
    EXPECT_EQ(scheduler_.attribute(run.queueID(), "device-uri"), printer.uri());

    for (const auto* document : {"hello.pdf", "hello.txt"})
        scheduler_.print(run.queueID(), document);
    ASSERT_TRUE(printer.receivedWithin(30s, 2)) << scheduler_.errorLog();
    for (const auto& document : printer.received())
        EXPECT_TRUE(document.contentType == "image/urf" || document.contentType == "application/pdf")
            << document.file << ' ' << document.contentType;
    EXPECT_EQ(agent_.leftovers(), Names{});
}

TEST_P(DriverlessPrinter, IsPrintedToOverTls) {
    const VirtualPrinter printer({.name = "Vault"});
    const auto run = agent_.run({printer.uri("ipps")});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.attribute(run.queueID(), "device-uri"), printer.uri("ipps"));
    scheduler_.print(run.queueID(), "hello.pdf");
    EXPECT_TRUE(printer.receivedWithin(30s)) << scheduler_.errorLog();
}

TEST_P(DriverlessPrinter, MayHaveAnIPv6Address) {
    const VirtualPrinter printer({.name = "Six"});
    const auto run = agent_.run({printer.uri("ipp", "[::1]")});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.attribute(run.queueID(), "device-uri"), printer.uri("ipp", "[::1]"));
    scheduler_.print(run.queueID(), "hello.pdf");
    EXPECT_TRUE(printer.receivedWithin(30s)) << scheduler_.errorLog();
}

TEST_P(DriverlessPrinter, GetsTheOptionsThatItHas) {
    const VirtualPrinter rich({.name = "Rich", .model = "ColorJet", .duplex = true, .colour = true});
    const VirtualPrinter plain({.name = "Plain", .model = "Mono"});
    const auto richRun = agent_.run({rich.uri()});
    const auto plainRun = agent_.run({plain.uri()});
    ASSERT_EQ(richRun.exitStatus, 0) << richRun.story();
    ASSERT_EQ(plainRun.exitStatus, 0) << plainRun.story();

    auto queue = scheduler_.attributes(richRun.queueID());
    EXPECT_EQ(queue["color-supported"], Names{"true"});
    EXPECT_EQ(queue["sides-supported"], (Names{"one-sided", "two-sided-long-edge", "two-sided-short-edge"}));
    queue = scheduler_.attributes(plainRun.queueID());
    EXPECT_EQ(queue["color-supported"], Names{"false"});
    EXPECT_EQ(queue["sides-supported"], Names{"one-sided"});
}

TEST_P(DriverlessPrinter, KeepsItsNameForPeople) {
    const ScriptedPrinter printer({.name = "Früh & \"Spät\" <Büro> 'é'"});
    const auto run = agent_.run({printer.uri()});
    ASSERT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.attribute(run.queueID(), "printer-info"), "Früh & \"Spät\" <Büro> 'é'");
}

TEST_P(DriverlessPrinter, IsServedOnlyOnce) {
    const VirtualPrinter printer({.name = "Once"});
    const auto first = agent_.run({printer.uri()});
    ASSERT_EQ(first.exitStatus, 0) << first.story();
    const auto before = stateOfQueues(scheduler_, {first.queueID()});

    const auto second = agent_.run({printer.uri()});
    EXPECT_EQ(second.exitStatus, 0) << second.story();
    EXPECT_EQ(second.queueIDs(), Names{}) << second.story();
    EXPECT_EQ(scheduler_.queues(), Names{first.queueID()});
    EXPECT_EQ(stateOfQueues(scheduler_, {first.queueID()}), before);
}

TEST_P(DriverlessPrinter, NamedTwiceOnOneCommandLineIsOneDevice) {
    const ScriptedPrinter printer;
    const auto run = agent_.run({printer.uri(), printer.uri(), printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs().size(), 1U) << run.story();
    EXPECT_EQ(scheduler_.queues().size(), 1U);
}

TEST_P(DriverlessPrinter, NamedByTwoSchemesIsTwoDevices) {
    const VirtualPrinter printer({.name = "Both"});
    const auto run = agent_.run({printer.uri("ipp"), printer.uri("ipps")});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(run.queueIDs().size(), 2U) << run.story();
    EXPECT_EQ(scheduler_.queues().size(), 2U);
}

TEST_P(DriverlessPrinter, IsAskedForWhatItsDriverNeedsOnly) {
    const ScriptedPrinter printer;
    ASSERT_EQ(agent_.run({printer.uri()}).exitStatus, 0);
    const auto requests = printer.requests();
    ASSERT_FALSE(requests.empty());
    EXPECT_EQ(requests[0].operation, IPP_OP_GET_PRINTER_ATTRIBUTES);
    EXPECT_EQ(requests[0].printerUri, printer.uri());
    EXPECT_EQ(requests[0].requestedAttributes,
              (Names{"document-format-supported", "output-mode-supported", "print-color-mode-supported",
                     "printer-dns-sd-name", "printer-location", "printer-make-and-model", "printer-uuid",
                     "sides-supported", "urf-supported"}));
}

TEST_P(DriverlessPrinter, GetsANameOfItsOwnWhenAnotherQueueHasIts) {
    const ScriptedPrinter first({.name = "Office"});
    const ScriptedPrinter second({.name = "Office"});
    const auto firstRun = agent_.run({first.uri()});
    const auto before = stateOfQueues(scheduler_, {firstRun.queueID()});
    const auto secondRun = agent_.run({second.uri()});
    ASSERT_EQ(secondRun.exitStatus, 0) << secondRun.story();
    EXPECT_EQ(firstRun.queueID(), "Office");
    EXPECT_NE(secondRun.queueID(), "Office");
    EXPECT_TRUE(secondRun.queueID().starts_with("Office")) << secondRun.story();
    EXPECT_EQ(scheduler_.attribute(secondRun.queueID(), "device-uri"), second.uri());
    EXPECT_NE(scheduler_.attribute(secondRun.queueID(), "printer-info"), "Office");
    EXPECT_EQ(stateOfQueues(scheduler_, {"Office"}), before);
}

TEST_P(DriverlessPrinter, MayShareItsNameWithHundreds) {
    constexpr std::size_t kPrinters = 200;
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    Names uris;
    for (std::size_t i = 0; i < kPrinters; ++i) {
        printers.push_back(
            std::make_unique<ScriptedPrinter>(ScriptedPrinterOptions{.name = "Classroom", .delay = 500ms}));
        uris.push_back(printers.back()->uri());
    }
    const auto run = agent_.run(uris, 100s);
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    auto made = run.queueIDs();
    std::ranges::sort(made);
    EXPECT_EQ(made.size(), kPrinters);
    EXPECT_EQ(scheduler_.queues(), made);
    Names served;
    for (const auto& queue : made)
        served.push_back(scheduler_.attribute(queue, "device-uri"));
    std::ranges::sort(served);
    std::ranges::sort(uris);
    EXPECT_EQ(served, uris);
    EXPECT_EQ(agent_.leftovers(), Names{});
}

TEST_P(DriverlessPrinter, DoesNotWaitForASlowOne) {
    const ScriptedPrinter slow({.name = "Slow", .delay = 4s});
    const ScriptedPrinter fast({.name = "Fast"});
    auto running = agent_.start({slow.uri(), fast.uri()});
    comesTrue([&] { return !scheduler_.queues().empty(); }, 3s);
    EXPECT_EQ(scheduler_.queues(), Names{"Fast"});
    ASSERT_TRUE(running->waitUntilEnded(60s));
    EXPECT_EQ(Agent::resultOf(*running).exitStatus, 0) << Agent::resultOf(*running).story();
    EXPECT_EQ(scheduler_.queues(), (Names{"Fast", "Slow"}));
}

}  // namespace
}  // namespace ventras
