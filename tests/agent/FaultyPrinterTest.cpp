#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

#include "tests/agent/Agent.h"
#include "tests/parts/BlackHole.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::ElementsAre;
using testing::HasSubstr;
using Names = std::vector<std::string>;

constexpr int kCannotHandle = 255;
constexpr int kBadData = 65;
constexpr int kCannotSerialize = -30886 & 0xFF;
constexpr int kNoIdentifier = -620 & 0xFF;

// No queue, no file, one line in the journal that names the device.
void expectNothingMade(const Agent& agent, const PrivateScheduler& scheduler, const AgentRun& run,
                       const std::string& uri) {
    EXPECT_EQ(run.queueIDs(), Names{}) << run.story();
    EXPECT_EQ(scheduler.queues(), Names{}) << run.story();
    EXPECT_EQ(agent.leftovers(), Names{}) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr(uri)) << run.story();
}

class FaultyPrinter : public testing::Test {
protected:
    PrivateScheduler scheduler_;
    Agent agent_{scheduler_};
};

struct QuickCase {
    const char* name;
    Fault fault;
    int status;
    const char* reason;
};

void PrintTo(const QuickCase& row, std::ostream* out) {
    *out << row.name;
}

class QuickFaults : public FaultyPrinter, public testing::WithParamInterface<QuickCase> {};

INSTANTIATE_TEST_SUITE_P(
    All, QuickFaults,
    testing::Values(QuickCase{"html", Fault::html, kCannotHandle, "no IPP answer"},
                    QuickCase{"garbage", Fault::garbage, kCannotHandle, "no IPP answer"},
                    QuickCase{"garbledIpp", Fault::garbledIpp, kCannotHandle, "no IPP answer"},
                    QuickCase{"halfThenClose", Fault::halfThenClose, kCannotHandle, "no IPP answer"},
                    QuickCase{"notFound", Fault::notFound, kCannotHandle, "HTTP 404"},
                    QuickCase{"unauthorized", Fault::unauthorized, kCannotHandle, "password"},
                    QuickCase{"closeAtOnce", Fault::closeAtOnce, kCannotHandle, "no IPP answer"},
                    QuickCase{"redirect", Fault::redirect, kCannotHandle, "HTTP 302"},
                    QuickCase{"noAttributes", Fault::noAttributes, kCannotHandle, "name"}),
    [](const auto& test) { return test.param.name; });

TEST_P(QuickFaults, EndTheRunAtOnce) {
    const ScriptedPrinter printer({.fault = GetParam().fault});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, GetParam().status) << run.story();
    EXPECT_LT(run.wallTime, 5s);
    EXPECT_THAT(run.standardError, HasSubstr(GetParam().reason));
    expectNothingMade(agent_, scheduler_, run, printer.uri());
}

// A printer that fails only when it is asked what it can do still gets a queue that its generic driver
// serves.
TEST_P(QuickFaults, LaterOnLeaveTheGenericDriver) {
    const ScriptedPrinter printer({.name = "Moody", .fault = GetParam().fault, .healthyRequests = 1});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{"Moody"});
    EXPECT_THAT(scheduler_.ppd("Moody"), HasSubstr("image/urf"));
    EXPECT_EQ(agent_.leftovers(), Names{});
}

TEST_F(FaultyPrinter, ThatRefusesTheConnectionEndsTheRunAtOnce) {
    const auto uri = "ipp://127.0.0.1:" + std::to_string(freePort()) + "/ipp/print";
    const auto run = agent_.run({uri});
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    EXPECT_LT(run.wallTime, 5s);
    EXPECT_THAT(run.standardError, HasSubstr("Unable to connect to 127.0.0.1:"));
    EXPECT_THAT(run.standardError, HasSubstr("Connection refused"));
    expectNothingMade(agent_, scheduler_, run, uri);
}

TEST_F(FaultyPrinter, ThatNoNameServerKnowsEndsTheRun) {
    const auto run = agent_.run({"ipp://printer.invalid/ipp/print"});
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    expectNothingMade(agent_, scheduler_, run, "ipp://printer.invalid/ipp/print");
}

// All the faults that last as long as the agent's patience, side by side in one run.
TEST_F(FaultyPrinter, IsWaitedForOnlySoLong) {
    const ScriptedPrinter good({.name = "Good"});
    const BlackHole hole;
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    Names uris{good.uri(), "ipp://127.0.0.1:" + std::to_string(hole.port()) + "/ipp/print"};
    for (const auto fault : {Fault::silent, Fault::drip, Fault::halfThenSilence, Fault::garbageThenSilence}) {
        printers.push_back(std::make_unique<ScriptedPrinter>(ScriptedPrinterOptions{.fault = fault}));
        uris.push_back(printers.back()->uri());
    }
    uris.push_back(printers.front()->uri("ipps"));

    auto running = agent_.start(uris);
    comesTrue([&] { return !scheduler_.queues().empty(); }, 5s);
    EXPECT_EQ(scheduler_.queues(), Names{"Good"}) << "the good printer should not wait for the others";

    ASSERT_TRUE(running->waitUntilEnded(60s));
    const auto run = Agent::resultOf(*running);
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    EXPECT_GE(run.wallTime, 29s);
    EXPECT_LT(run.wallTime, 40s);
    EXPECT_EQ(scheduler_.queues(), Names{"Good"});
    EXPECT_EQ(agent_.leftovers(), Names{});
    for (std::size_t i = 1; i < uris.size(); ++i)
        EXPECT_THAT(run.standardError, HasSubstr(uris[i]));
}

struct HostileCase {
    const char* name;
    std::vector<RawAttribute> attributes;
    int status;
};

void PrintTo(const HostileCase& row, std::ostream* out) {
    *out << row.name;
}

const std::string kTenThousand(10'000, 'x');
const std::string kInvalidUtf8 =
    "Dr\xfc\xff\xfe"
    "cker";
const std::string kControls = "Prin\nter\r\x1b[31m\a \x7f";

// Every text that the agent reads, as the given one.
std::vector<RawAttribute> allTexts(const std::string& text) {
    return {{IPP_TAG_NAME, "printer-dns-sd-name", text},
            {IPP_TAG_TEXT, "printer-location", text},
            {IPP_TAG_TEXT, "printer-make-and-model", text}};
}

class HostileTexts : public FaultyPrinter, public testing::WithParamInterface<HostileCase> {};

INSTANTIATE_TEST_SUITE_P(
    All, HostileTexts,
    testing::Values(
        HostileCase{"Quotes", allTexts("O'Neil \"the $(touch x)\" `y` <&> \\ %s %n ; */ *"), 0},
        HostileCase{"TenThousandCharacters", allTexts(kTenThousand), 0},
        HostileCase{"Paths", allTexts("../../../../etc/passwd"), 0}, HostileCase{"Blank", allTexts("   "), 0},
        HostileCase{"ControlCharacters", allTexts(kControls), kCannotSerialize},
        HostileCase{"LineEnds", allTexts("two\nlines"), kBadData},
        HostileCase{"InvalidUtf8", allTexts(kInvalidUtf8), kCannotHandle},
        HostileCase{"Empty", allTexts(""), kNoIdentifier},
        HostileCase{"NameWithTheWrongTag", {{IPP_TAG_TEXT, "printer-dns-sd-name", "Text"}}, 0},
        HostileCase{"UrfWithTheWrongTag", {{IPP_TAG_TEXT, "urf-supported", "V1.4"}}, kCannotHandle},
        HostileCase{"UrfAsANumber", {{IPP_TAG_INTEGER, "urf-supported", "\0\0\0\7"s}}, kCannotHandle},
        HostileCase{
            "FormatsAsAnEmptyList", {{IPP_TAG_NOVALUE, "document-format-supported", ""}}, kCannotHandle},
        HostileCase{"EverythingUnknown",
                    {{IPP_TAG_UNKNOWN, "printer-dns-sd-name", ""},
                     {IPP_TAG_UNKNOWN, "printer-make-and-model", ""},
                     {IPP_TAG_UNKNOWN, "urf-supported", ""}},
                    kCannotHandle}),
    [](const auto& test) { return test.param.name; });

TEST_P(HostileTexts, MakeAWholeQueueOrNone) {
    scheduler_.addQueue("Present", "usb://Acme/Present", readFile(testDocument("colour-duplex.ppd")));
    const auto before = stateOfQueues(scheduler_, {"Present"});
    const ScriptedPrinter printer({.rawAttributes = GetParam().attributes});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, GetParam().status) << run.story();
    EXPECT_LT(run.wallTime, 10s);

    const auto made = run.queueIDs();
    EXPECT_EQ(made.size(), GetParam().status == 0 ? 1U : 0U) << run.story();
    auto expected = made;
    expected.emplace_back("Present");
    std::ranges::sort(expected);
    EXPECT_EQ(scheduler_.queues(), expected) << run.story();
    for (const auto& queue : made) {
        EXPECT_EQ(scheduler_.attribute(queue, "device-uri"), printer.uri());
        EXPECT_EQ(scheduler_.attribute(queue, "printer-state"), "3");
        EXPECT_NE(scheduler_.ppd(queue), "") << "a raw queue";
    }
    EXPECT_EQ(stateOfQueues(scheduler_, {"Present"}), before);
    EXPECT_EQ(agent_.leftovers(), Names{});
    if (GetParam().status != 0) {
        EXPECT_THAT(run.standardError, HasSubstr(printer.uri())) << run.story();
    }
}

TEST_F(FaultyPrinter, WithThousandsOfAttributesIsServed) {
    const ScriptedPrinter printer(
        {.name = "Talkative", .edit = [](ipp_t* answer) {
             for (int i = 0; i < 5000; ++i)
                 setAttribute(answer, IPP_TAG_KEYWORD, ("x-" + std::to_string(i)).c_str(), "y");
             std::vector<std::string> sizes;
             std::vector<const char*> pointers;
             for (int i = 0; i < 3000; ++i)
                 sizes.push_back("custom_" + std::to_string(i) + "_100x" + std::to_string(100 + i) + "mm");
             for (const auto& size : sizes)
                 pointers.push_back(size.c_str());
             removeAttribute(answer, "media-supported");
             ippAddStrings(answer, IPP_TAG_PRINTER, IPP_TAG_KEYWORD, "media-supported",
                           static_cast<int>(pointers.size()), nullptr, pointers.data());
         }});
    const auto run = agent_.run({printer.uri()});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(scheduler_.queues(), Names{"Talkative"});
}

TEST_F(FaultyPrinter, DoesNotStopTheOthers) {
    const ScriptedPrinter bad({.fault = Fault::garbage});
    const ScriptedPrinter good({.name = "Good"});
    const auto run = agent_.run({bad.uri(), good.uri()});
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    EXPECT_THAT(run.queueIDs(), ElementsAre("Good"));
}

}  // namespace
}  // namespace ventras
