#include "platform/IdleConnections.h"

#include <gtest/gtest.h>

#include <chrono>
#include <optional>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

HttpPtr connectTo(const ScriptedPrinter& printer) {
    return HttpPtr{
        httpConnect2("127.0.0.1", printer.port(), nullptr, AF_INET, HTTP_ENCRYPTION_NEVER, 1, 5000, nullptr)};
}

bool answers(http_t* http) {
    const IppPtr answer{cupsDoRequest(http, ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES), "/")};
    return answer != nullptr;
}

class IdleConnectionsTest : public testing::Test {
protected:
    static Peer peer(int port) { return {"127.0.0.1", port, HTTP_ENCRYPTION_NEVER}; }

    IdleConnections idle;
};

TEST_F(IdleConnectionsTest, AreGivenToWhoeverWantsThatPeerNext) {
    const ScriptedPrinter printer;
    auto made = connectTo(printer);
    const auto* const same = made.get();
    ASSERT_TRUE(answers(made.get()));
    idle.keep(peer(printer.port()), std::move(made));
    const auto taken = idle.take(peer(printer.port()));
    EXPECT_EQ(taken.get(), same);
    EXPECT_TRUE(answers(taken.get()));
    EXPECT_EQ(printer.connectionCount(), 1U);
    EXPECT_EQ(idle.take(peer(printer.port())), nullptr);
}

TEST_F(IdleConnectionsTest, AreNotGivenToWhoeverWantsAnotherPeer) {
    const ScriptedPrinter printer;
    idle.keep(peer(printer.port()), connectTo(printer));
    EXPECT_EQ(idle.take(peer(printer.port() + 1)), nullptr);
    EXPECT_EQ(idle.take({"localhost", printer.port(), HTTP_ENCRYPTION_NEVER}), nullptr);
    EXPECT_EQ(idle.take({"127.0.0.1", printer.port(), HTTP_ENCRYPTION_ALWAYS}), nullptr);
    EXPECT_NE(idle.take(peer(printer.port())), nullptr);
}

TEST_F(IdleConnectionsTest, AreNotGivenOutOnceThePeerHasHungUp) {
    std::optional<ScriptedPrinter> printer;
    printer.emplace();
    const auto port = printer->port();
    idle.keep(peer(port), connectTo(*printer));
    printer.reset();
    EXPECT_EQ(idle.take(peer(port)), nullptr);
}

TEST_F(IdleConnectionsTest, AreHungUpAfterAWhileWhetherOrNotAnybodyLooks) {
    const ScriptedPrinter printer;
    auto made = connectTo(printer);
    const auto* const watched = made.get();
    idle.keep(peer(printer.port()), std::move(made));
    // It stays with its owner until somebody calls, only its socket is shut down.
    EXPECT_TRUE(
        comesTrue([&] { return hasEnded(const_cast<http_t*>(watched)); }, 3 * IdleConnections::kLongestRest));
    EXPECT_EQ(idle.take(peer(printer.port())), nullptr);
}

TEST_F(IdleConnectionsTest, AreFewToEachPeer) {
    const ScriptedPrinter printer;
    const ScriptedPrinter other;
    for (std::size_t i = 0; i < IdleConnections::kMostForOne + 2; ++i)
        idle.keep(peer(printer.port()), connectTo(printer));
    idle.keep(peer(other.port()), connectTo(other));
    std::size_t kept = 0;
    while (idle.take(peer(printer.port())))
        ++kept;
    EXPECT_EQ(kept, IdleConnections::kMostForOne);
    EXPECT_NE(idle.take(peer(other.port())), nullptr);
}

TEST_F(IdleConnectionsTest, AreFewAtAllAndThoseUsedLastStay) {
    const ScriptedPrinter printer;
    const auto numbered = [](std::size_t i) { return Peer{"host " + std::to_string(i), 631}; };
    for (std::size_t i = 0; i <= IdleConnections::kMost; ++i)
        idle.keep(numbered(i), connectTo(printer));
    EXPECT_EQ(idle.take(numbered(0)), nullptr);
    EXPECT_NE(idle.take(numbered(1)), nullptr);
    EXPECT_NE(idle.take(numbered(IdleConnections::kMost)), nullptr);
}

}  // namespace
}  // namespace ventras
