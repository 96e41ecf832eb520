#include "devices/TXTQuery.h"

#include <gtest/gtest.h>
#include <net/if.h>

#include <chrono>

#include "devices/IPPUSBObject.h"
#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/ippusb/ScriptedDNSSD.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Kind = ScriptedWakeUp::Kind;

constexpr auto kLocalOnly = kDNSServiceInterfaceIndexLocalOnly;
constexpr auto kReply = Kind::Reply;
const std::string kRecord =
    "\x0crp=ipp/print\x09"
    "usb_MDL=X";
const DeviceDescription kDescription{{"rp", "ipp/print"}, {"usb_MDL", "X"}};

struct TXTQuery : testing::Test {
    ScriptedDNSSD responder;

    // What a query gives, and how long it takes.
    struct Answer {
        std::optional<DeviceDescription> dictionary;
        std::chrono::milliseconds time;
    };
    Answer ask(const std::string& name = "Laser") {
        const auto start = std::chrono::steady_clock::now();
        auto dictionary = queryTXTRecord(name);
        return {std::move(dictionary), std::chrono::duration_cast<std::chrono::milliseconds>(
                                           std::chrono::steady_clock::now() - start)};
    }
    Answer askWhen(std::vector<ScriptedWakeUp> wakeUps) {
        responder.queries = {{kLocalOnly, {.wakeUps = std::move(wakeUps)}}};
        return ask();
    }
};

TEST_F(TXTQuery, AsksForTheTXTRecordOfTheServiceOnThisMachineAlone) {
    responder.queries = {{kLocalOnly, ScriptedDNSSD::answering(kRecord)}};
    EXPECT_EQ(ask("Laser 9 (USB)").dictionary, kDescription);
    const QueryCall expected{0, kLocalOnly, R"(Laser\0329\032\040USB\041._ipp._tcp.local)", 16, 1};
    EXPECT_EQ(responder.calls(), std::vector{expected});
}

TEST_F(TXTQuery, FallsBackToLoopbackWhereThereIsNoLocalOnlyInterface) {
    const auto loopback = if_nametoindex("lo");
    responder.queries = {{kLocalOnly, {.error = kDNSServiceErr_Unsupported}},
                         {loopback, ScriptedDNSSD::answering(kRecord)}};
    EXPECT_EQ(ask().dictionary, kDescription);
    ASSERT_EQ(responder.calls().size(), 2U);
    EXPECT_EQ(responder.calls().back().interface, loopback);
}

TEST_F(TXTQuery, GivesUpAtAnyOtherErrorOfTheStart) {
    for (const auto error : {kDNSServiceErr_Unknown, kDNSServiceErr_NoMemory, kDNSServiceErr_BadParam}) {
        responder.queries = {{kLocalOnly, {.error = error}},
                             {if_nametoindex("lo"), ScriptedDNSSD::answering(kRecord)}};
        EXPECT_EQ(ask().dictionary, std::nullopt) << error;
    }
}

TEST_F(TXTQuery, DoesNotAskForANameThatNoServiceCanHave) {
    responder.queries = {{kLocalOnly, ScriptedDNSSD::answering(kRecord)}};
    for (const auto& name : {std::string(), std::string(64, 'x')})
        EXPECT_EQ(ask(name).dictionary, std::nullopt) << name;
    EXPECT_TRUE(responder.calls().empty());
}

TEST_F(TXTQuery, WaitsThreeSecondsForAnAnswer) {
    const auto answer = askWhen({});
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_GE(answer.time, 2900ms);
    EXPECT_LE(answer.time, 3500ms);
    EXPECT_EQ(responder.alive(), 0);
}

TEST_F(TXTQuery, TakesAnAnswerThatComesLate) {
    EXPECT_EQ(askWhen({{kReply, 1500ms, 0, kRecord}}).dictionary, kDescription);
    EXPECT_EQ(responder.alive(), 0);
}

TEST_F(TXTQuery, WaitsOnWhenTheLibraryOnlyTalksToItsDaemon) {
    EXPECT_EQ(
        askWhen({{Kind::NoReply, 1ms, 0, ""}, {Kind::NoReply, 300ms, 0, ""}, {kReply, 300ms, 0, kRecord}})
            .dictionary,
        kDescription);
}

TEST_F(TXTQuery, PassesOverErrorsAndEmptyRecords) {
    EXPECT_EQ(
        askWhen(
            {{kReply, 1ms, kDNSServiceErr_Unknown, kRecord}, {kReply, 0ms, 0, ""}, {kReply, 0ms, 0, kRecord}})
            .dictionary,
        kDescription);
}

TEST_F(TXTQuery, WaitsNoLongerOnceAReplyWasOfNoUse) {
    const auto answer = askWhen({{kReply, 1ms, kDNSServiceErr_Unknown, ""}, {kReply, 1s, 0, kRecord}});
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_LT(answer.time, 500ms);
}

TEST_F(TXTQuery, IsNotHeldUpByEndlessUselessReplies) {
    const auto answer =
        askWhen(std::vector(40'000, ScriptedWakeUp{kReply, 100us, kDNSServiceErr_Unknown, ""}));
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_LE(answer.time, 3500ms);
}

TEST_F(TXTQuery, EndsWhenTheLibraryFails) {
    const auto answer = askWhen({{Kind::Failure, 1ms, 0, ""}, {kReply, 1ms, 0, kRecord}});
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_LT(answer.time, 500ms);
    EXPECT_EQ(responder.alive(), 0);
}

TEST_F(TXTQuery, LeavesALibraryCallThatHangsBehind) {
    responder.queries = {{kLocalOnly, {.hangs = true, .wakeUps = {{.record = kRecord}}}}};
    const auto answer = ask();
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_LE(answer.time, 3500ms);
    responder.release();
    EXPECT_EQ(responder.alive(), 0);
}

TEST_F(TXTQuery, GivesAnEmptyDictionaryForARecordThatCannotBeRead) {
    EXPECT_EQ(askWhen({{kReply, 1ms, 0, "\x7ftoo=short"}}).dictionary, DeviceDescription{});
}

struct IPPUSBQueries : TXTQuery {
    FakePlatform fake;
    PPDManager drivers{fake.platform};
    IPPUSBObject printer{drivers, "Laser"};
};

TEST_F(IPPUSBQueries, AreNotMadeBeforeTheRecordIsNeeded) {
    printer.registeredName();
    EXPECT_TRUE(responder.calls().empty());
}

TEST_F(IPPUSBQueries, StopOnceThereIsARecord) {
    responder.queries = {{kLocalOnly, ScriptedDNSSD::answering(kRecord)}};
    EXPECT_EQ(printer.txtDictionary(), kDescription);
    EXPECT_EQ(printer.txtDictionary(), kDescription);
    EXPECT_EQ(responder.calls().size(), 1U);
}

TEST_F(IPPUSBQueries, StopAlsoWhenTheRecordHoldsNothing) {
    responder.queries = {{kLocalOnly, ScriptedDNSSD::answering(std::string(1, '\0'))}};
    EXPECT_EQ(printer.txtDictionary(), DeviceDescription{});
    EXPECT_EQ(printer.txtDictionary(), DeviceDescription{});
    EXPECT_EQ(responder.calls().size(), 1U);
}

TEST_F(IPPUSBQueries, AreRepeatedWhileNobodyAnswers) {
    EXPECT_EQ(printer.txtDictionary(), std::nullopt);
    EXPECT_EQ(printer.deviceURI(), "");
    responder.queries = {{kLocalOnly, ScriptedDNSSD::answering(kRecord)}};
    EXPECT_EQ(printer.txtDictionary(), kDescription);
    EXPECT_EQ(responder.calls().size(), 3U);
}

TEST_F(IPPUSBQueries, AreMadeOnceForEachQuestionThatNobodyAnswers) {
    printer.uris();
    printer.name();
    printer.supportsFax();
    printer.matchExistingQueues({});
    EXPECT_EQ(responder.calls().size(), 4U);
}

TEST_F(IPPUSBQueries, AskForTheNameThatThePrinterHasNow) {
    printer.setRegisteredName("Other");
    printer.txtDictionary();
    ASSERT_EQ(responder.calls().size(), 1U);
    EXPECT_EQ(responder.calls().front().fullName, "Other._ipp._tcp.local");
}

}  // namespace
}  // namespace ventras
