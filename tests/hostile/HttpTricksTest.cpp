#include <chrono>
#include <memory>

#include "tests/hostile/HostileRun.h"
#include "tests/hostile/RawPeer.h"

// What can be done to a client below IPP. Answers that are whole, but wrong, are tested with faulty printers.

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::HasSubstr;

constexpr int kCannotHandle = 255;

const std::string kOk = "HTTP/1.1 200 OK\r\nContent-Type: application/ipp\r\n";

struct SpeechCase {
    const char* name;
    RawSpeech speech;
};

void PrintTo(const SpeechCase& row, std::ostream* out) {
    *out << row.name;
}

class HttpTricks : public HostileRun {
protected:
    Agent agent_{scheduler_};
};

class AnswersThatEnd : public HttpTricks, public testing::WithParamInterface<SpeechCase> {};

INSTANTIATE_TEST_SUITE_P(
    All, AnswersThatEnd,
    testing::Values(
        SpeechCase{"NoStatusOfHttp", {"HTTP/1.2 42427 U,T\xd0H\xc6T\r\n\r\n"}},
        SpeechCase{"NegativeStatus", {"HTTP/1.1 -1 What\r\n\r\n"}},
        SpeechCase{"NoProtocolAtAll", {"220 mail.example ESMTP\r\n"}},
        SpeechCase{"StatusLineCutShort", {"HTTP/1.1 200"}},
        SpeechCase{"HeaderCutShort", {"HTTP/1.1 426 Upgrade Required\r\nUpgrade: TLS/1.2,HTTP/"}},
        SpeechCase{"ContinueAlone", {"HTTP/1.1 100 Continue\r\n\r\n"}},
        SpeechCase{
            "UpgradeAgainAndAgain",
            {"HTTP/1.1 426 Upgrade Required\r\nUpgrade: TLS/1.2,HTTP/1.1\r\nContent-Length: 0\r\n\r\n"}},
        SpeechCase{"SwitchingProtocols", {"HTTP/1.1 101 Switching Protocols\r\nUpgrade: TLS/1.2\r\n\r\n"}},
        SpeechCase{"NegativeLength", {kOk + "Content-Length: -1\r\n\r\n\2\0\0\0\0\0\0\1\3"s}},
        SpeechCase{"HugeLength", {kOk + "Content-Length: 99999999999999999999\r\n\r\n"}},
        SpeechCase{"HugeChunk", {kOk + "Transfer-Encoding: chunked\r\n\r\nffffffffffffffff\r\n"}},
        SpeechCase{"NoChunk", {kOk + "Transfer-Encoding: chunked\r\n\r\nnone\r\n"}},
        SpeechCase{"NoGzip", {kOk + "Content-Encoding: gzip\r\nContent-Length: 4\r\n\r\nabcd"}},
        SpeechCase{"HeaderOfAMegabyte",
                   {"HTTP/1.1 200 OK\r\nX: " + std::string(1'000'000, 'x') + "\r\n\r\n"}},
        SpeechCase{"CookiesForTheLog", {"HTTP/1.1 404 \x1b[31mRed\x07\r\nSet-Cookie: a=b\r\n\r\n"}}),
    [](const auto& test) { return test.param.name; });

TEST_P(AnswersThatEnd, EndTheRunAtOnce) {
    const RawPeer peer(GetParam().speech);
    const auto run = agent_.run({peer.uri()}, 25s);
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    EXPECT_LT(run.wallTime, 5s);
    EXPECT_THAT(run.standardError, HasSubstr(peer.uri()));
    EXPECT_EQ(newQueues(), Names{});
    expectHarmless(agent_, run);
}

TEST_F(HttpTricks, ThatAreRefusedAreNotHeardToTheirEnd) {
    const std::string begin = kOk + "\r\n\2\0\0\0\0\0\0\1\4"s;
    for (const auto& more : {"\x42\0\1x\0\1y"s, "\x34\0\0\0\0\x4a\0\0\0\1m"s, "\2\4"s}) {
        const RawPeer peer({begin, more});
        const auto run = agent_.run({peer.uri()}, 25s);
        EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
        EXPECT_LT(run.wallTime, 5s * kAllowance) << testing::PrintToString(more);
    }
}

// Side by side: the longest of them is what a run takes.
TEST_F(HttpTricks, WithoutEndAreListenedToOnlySoLong) {
    const RawSpeech speeches[] = {
        {"", "HTTP/1.1 100 Continue\r\n\r\n"},
        {"HTTP/1.1 200 OK\r\n", "X-Header: one more\r\n"},
        {"HTTP/1.1 200 OK\r\nX: ", "endless"},
        {kOk + "Transfer-Encoding: chunked\r\n\r\n", "1\r\n\2\r\n"},
        {kOk + "\r\n\2\0\0\0\0\0\0\1\4"s, "\x42\0\1x\0\1y"s},  // attributes
        {kOk + "\r\n\2\0\0\0\0\0\0\1\4"s,
         "\x34\0\0\0\0\x4a\0\0\0\1m"s},  // collections, each within the one before
    };
    std::vector<std::unique_ptr<RawPeer>> peers;
    Names uris;
    for (const auto& speech : speeches) {
        peers.push_back(std::make_unique<RawPeer>(speech));
        uris.push_back(peers.back()->uri());
    }
    const auto run = agent_.run(uris, 60s);
    EXPECT_EQ(run.exitStatus, kCannotHandle) << run.story();
    EXPECT_LT(run.wallTime, 40s);
    EXPECT_LT(run.peakKilobytes, 100'000 * kAllowance);
    for (const auto& uri : uris)
        EXPECT_THAT(run.standardError, HasSubstr(uri));
    EXPECT_EQ(newQueues(), Names{});
    expectHarmless(agent_, run);
}

}  // namespace
}  // namespace ventras
