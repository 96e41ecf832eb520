#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <thread>
#include <vector>

#include "platform/IppConnection.h"
#include "tests/parts/Loopback.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedConnection.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

IppPtr request(ipp_op_t operation) {
    IppPtr request{ippNewRequest(operation)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/ipp/print");
    return request;
}

IppPtr question() {
    return request(IPP_OP_GET_PRINTER_ATTRIBUTES);
}

IppConnection connectTo(int port) {
    return IppConnection::toPrinter("127.0.0.1", port, HTTP_ENCRYPTION_IF_REQUESTED, 2s);
}

bool isAnswered(int port) {
    return connectTo(port).exchange(question(), "/ipp/print").succeeded();
}

TEST(IppConnections, LeaveTheirsToOneFurtherQuestionToAPrinter) {
    const ScriptedPrinter printer;
    for (int i = 0; i < 2; ++i)
        EXPECT_TRUE(isAnswered(printer.port()));
    EXPECT_EQ(printer.connectionCount(), 1U);
    EXPECT_TRUE(isAnswered(printer.port()));
    EXPECT_EQ(printer.connectionCount(), 2U);
}

TEST(IppConnections, ThatFailedAreNotLeftToAnybody) {
    const ScriptedPrinter printer({.fault = Fault::html});
    for (int i = 0; i < 2; ++i)
        EXPECT_FALSE(isAnswered(printer.port()));
    EXPECT_EQ(printer.connectionCount(), 2U);
}

TEST(IppConnections, ToTheSchedulerAreLeftToAllWhoFollow) {
    const ScriptedPrinter scheduler;
    const UseScheduler use("127.0.0.1:" + std::to_string(scheduler.port()));
    for (int i = 0; i < 5; ++i)
        EXPECT_TRUE(IppConnection::toScheduler(2s).exchange(question(), "/").succeeded());
    EXPECT_EQ(scheduler.connectionCount(), 1U);
}

TEST(IppConnections, ToASchedulerThatStartedAgainAreMadeAnew) {
    PrivateScheduler scheduler;
    scheduler.addQueue("Q", "usb://Acme/ColorJet");
    const UseScheduler use(scheduler);
    const auto asks = [] {
        return IppConnection::toScheduler(5s).exchange(request(IPP_OP_CUPS_GET_PRINTERS), "/").succeeded();
    };
    EXPECT_TRUE(asks());
    scheduler.stop();
    scheduler.start();
    EXPECT_TRUE(asks());
    scheduler.kill();
    scheduler.start();
    EXPECT_TRUE(asks());
}

// Answers the first request of its first connection, and hangs up on the second when that has arrived: the
// moment at which nobody can know whether it was carried out. Later connections are served properly.
class HangsUpOnce {
public:
    int port() const { return listener_.port(); }
    int requests() const { return requests_; }

private:
    ScriptedReply reply(const HttpMessage& message, int connection, int& count) {
        ++requests_;
        if (connection == 0 && count++ == 1)
            return {.bytes = "", .after = AfterReply::close};
        const IppPtr asked = decodeIpp(message.body);
        const IppPtr answer{ippNewResponse(asked.get())};
        return {.bytes = httpResponse("200 OK", "application/ipp", encodeIpp(answer.get()))};
    }

    void serve(const std::stop_token& stop) {
        for (int number = 0; waitFor(listener_.descriptor(), stop); ++number) {
            int count = 0;
            ScriptedConnection connection(
                accept(listener_.descriptor(), nullptr, nullptr),
                [&](const HttpMessage& message) { return reply(message, number, count); });
            while (!connection.isOver() && waitFor(connection.socket(), stop)) {
                connection.onReadable();
                connection.advance();
            }
        }
    }

    static bool waitFor(int socket, const std::stop_token& stop) {
        pollfd descriptor{socket, POLLIN, 0};
        while (!stop.stop_requested())
            if (poll(&descriptor, 1, 20) > 0)
                return true;
        return false;
    }

    ListeningSocket listener_{LoopbackAddress::v4};
    std::atomic<int> requests_ = 0;
    std::jthread thread_{[this](const std::stop_token& stop) { serve(stop); }};
};

TEST(IppConnections, AskAgainWhenAPeerHangsUpOnAQuestion) {
    const HangsUpOnce peer;
    auto connection = connectTo(peer.port());
    ASSERT_TRUE(connection.exchange(question(), "/").succeeded());
    const auto answer = connection.exchange(question(), "/");
    EXPECT_TRUE(answer.succeeded()) << answer.reason;
    EXPECT_EQ(peer.requests(), 3);
}

TEST(IppConnections, AskAgainOnAConnectionThatAnotherLeft) {
    const HangsUpOnce peer;
    EXPECT_TRUE(isAnswered(peer.port()));
    EXPECT_TRUE(isAnswered(peer.port()));
    EXPECT_EQ(peer.requests(), 3);
}

TEST(IppConnections, DoNotRepeatWhatChangesSomething) {
    const HangsUpOnce peer;
    auto connection = connectTo(peer.port());
    ASSERT_TRUE(connection.exchange(question(), "/").succeeded());
    EXPECT_FALSE(connection.exchange(request(IPP_OP_CUPS_ADD_MODIFY_PRINTER), "/").succeeded());
    EXPECT_EQ(peer.requests(), 2);
}

}  // namespace
}  // namespace ventras
