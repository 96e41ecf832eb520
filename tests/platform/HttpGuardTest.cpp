#include "platform/HttpGuard.h"

#include <gtest/gtest.h>
#include <sys/socket.h>

#include <array>

#include "platform/Handles.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

HttpPtr connectTo(const ScriptedPrinter& printer) {
    return HttpPtr{
        httpConnect2("127.0.0.1", printer.port(), nullptr, AF_INET, HTTP_ENCRYPTION_NEVER, 1, 5000, nullptr)};
}

// Waits for a line from the other side; only that side or a guard can end it.
bool hearsALine(http_t* http) {
    std::array<char, 256> line;
    return httpGets(line.data(), static_cast<int>(line.size()), http) != nullptr;
}

TEST(HttpGuard, EndsAReadAtItsDeadline) {
    const ScriptedPrinter silent({.fault = Fault::silent});
    const auto http = connectTo(silent);
    ASSERT_TRUE(http);
    const auto begin = Clock::now();
    const HttpGuard guard(http.get(), Deadline::after(300ms));
    EXPECT_FALSE(hearsALine(http.get()));
    EXPECT_GE(Clock::now() - begin, 300ms);
    EXPECT_LT(Clock::now() - begin, 800ms);
}

TEST(HttpGuard, EndsATlsHandshakeAtItsDeadline) {
    const ScriptedPrinter silent({.fault = Fault::silent});
    const HttpPtr http{
        httpConnect2("127.0.0.1", silent.port(), nullptr, AF_INET, HTTP_ENCRYPTION_ALWAYS, 1, 0, nullptr)};
    ASSERT_TRUE(http);
    const auto begin = Clock::now();
    const HttpGuard guard(http.get(), Deadline::after(300ms));
    EXPECT_NE(httpReconnect2(http.get(), 5000, nullptr), 0);
    EXPECT_LT(Clock::now() - begin, 1500ms);
}

TEST(HttpGuard, LeavesAConnectionAloneBeforeItsDeadline) {
    const ScriptedPrinter printer;
    const auto http = connectTo(printer);
    for (int i = 0; i < 3; ++i) {
        const HttpGuard guard(http.get(), Deadline::after(10s));
        const IppPtr answer{cupsDoRequest(http.get(), ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES), "/")};
        EXPECT_TRUE(answer) << cupsLastErrorString();
    }
    EXPECT_EQ(printer.connectionCount(), 1U);
}

TEST(HttpGuard, LeavesAtOnceWhenTheWorkIsDone) {
    const ScriptedPrinter printer;
    const auto http = connectTo(printer);
    const auto begin = Clock::now();
    for (int i = 0; i < 100; ++i)
        const HttpGuard guard(http.get(), Deadline::after(10s));
    EXPECT_LT(Clock::now() - begin, 2s);
}

TEST(HttpGuard, ShutsDownAConnectionWhoseTimeIsOverAlready) {
    const ScriptedPrinter silent({.fault = Fault::silent});
    const auto http = connectTo(silent);
    const HttpGuard guard(http.get(), Deadline::after(0ms));
    const auto begin = Clock::now();
    EXPECT_FALSE(hearsALine(http.get()));
    EXPECT_LT(Clock::now() - begin, 1500ms);
}

}  // namespace
}  // namespace ventras
