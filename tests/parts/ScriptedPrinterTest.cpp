#include "tests/parts/ScriptedPrinter.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <memory>
#include <optional>

#include "platform/Handles.h"
#include "tests/parts/BlackHole.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

std::string requestBytes(const std::vector<const char*>& wanted = {}) {
    const IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/ipp/print");
    if (!wanted.empty())
        ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                      static_cast<int>(wanted.size()), nullptr, wanted.data());
    const auto body = encodeIpp(request.get());
    return "POST /ipp/print HTTP/1.1\r\nHost: localhost\r\nContent-Type: "
           "application/ipp\r\nContent-Length: " +
           std::to_string(body.size()) + "\r\n\r\n" + body;
}

struct Heard {
    std::string bytes;
    bool hungUp = false;
};

// Listens until the other side hangs up or the time is over.
Heard hear(int socket, std::chrono::milliseconds limit) {
    Heard heard;
    const auto end = Clock::now() + limit;
    while (!heard.hungUp && Clock::now() < end) {
        const auto left = std::chrono::duration_cast<std::chrono::microseconds>(end - Clock::now()).count();
        const timeval patience{left / 1'000'000, left % 1'000'000 + 1};
        setsockopt(socket, SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience);
        std::array<char, 4096> buffer;
        const auto length = recv(socket, buffer.data(), buffer.size(), 0);
        if (length > 0)
            heard.bytes.append(buffer.data(), static_cast<std::size_t>(length));
        heard.hungUp = length == 0 || (length < 0 && errno == ECONNRESET);
    }
    return heard;
}

Heard converse(const ScriptedPrinter& printer, std::string_view request, std::chrono::milliseconds limit) {
    const int socket = connectToLoopback(LoopbackAddress::v4, printer.port());
    if (socket < 0)
        return {};
    send(socket, request.data(), request.size(), MSG_NOSIGNAL);
    auto heard = hear(socket, limit);
    close(socket);
    return heard;
}

IppPtr ask(const ScriptedPrinter& printer, const std::vector<const char*>& wanted = {},
           const std::string& resource = "/ipp/print", int family = AF_INET) {
    const HttpPtr http{httpConnect2(family == AF_INET ? "127.0.0.1" : "::1", printer.port(), nullptr, family,
                                    HTTP_ENCRYPTION_NEVER, 1, 5000, nullptr)};
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    if (!wanted.empty())
        ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                      static_cast<int>(wanted.size()), nullptr, wanted.data());
    return IppPtr{cupsDoRequest(http.get(), request.release(), resource.c_str())};
}

std::optional<std::string> text(const IppPtr& answer, const char* name) {
    auto* attribute = ippFindAttribute(answer.get(), name, IPP_TAG_ZERO);
    const char* value = ippGetString(attribute, 0, nullptr);
    return value != nullptr ? std::optional<std::string>{value} : std::nullopt;
}

TEST(ScriptedPrinter, AnswersLikeADriverlessPrinter) {
    const ScriptedPrinter printer({.name = "Front desk", .makeAndModel = "Acme Nine"});
    const auto answer = ask(printer);
    ASSERT_TRUE(answer) << cupsLastErrorString();
    EXPECT_EQ(ippGetStatusCode(answer.get()), IPP_STATUS_OK);
    EXPECT_EQ(text(answer, "printer-name"), "Front desk");
    EXPECT_EQ(text(answer, "printer-make-and-model"), "Acme Nine");
    EXPECT_EQ(text(answer, "urf-supported"), "V1.4");
}

TEST(ScriptedPrinter, SendsOnlyWhatIsRequestedAndRemembersIt) {
    const ScriptedPrinter printer;
    const auto answer = ask(printer, {"printer-name", "printer-uuid"}, "/ipp/print/x");
    EXPECT_TRUE(text(answer, "printer-name"));
    EXPECT_FALSE(text(answer, "printer-location"));
    const auto requests = printer.requests();
    ASSERT_EQ(requests.size(), 1U);
    EXPECT_EQ(requests[0].operation, IPP_OP_GET_PRINTER_ATTRIBUTES);
    EXPECT_EQ(requests[0].resource, "/ipp/print/x");
    EXPECT_EQ(requests[0].requestedAttributes, (std::vector<std::string>{"printer-name", "printer-uuid"}));
    EXPECT_EQ(printer.connectionCount(), 1U);
}

TEST(ScriptedPrinter, ListensOnIPv6) {
    const ScriptedPrinter printer({.listensOnIPv4 = false, .listensOnIPv6 = true});
    EXPECT_TRUE(ask(printer, {}, "/ipp/print", AF_INET6));
    EXPECT_EQ(connectToLoopback(LoopbackAddress::v4, printer.port()), -1);
    EXPECT_EQ(printer.uri("ipp"), "ipp://[::1]:" + std::to_string(printer.port()) + "/ipp/print");
}

TEST(ScriptedPrinter, ChangesItsAnswersAsTold) {
    const ScriptedPrinter printer({.edit = [](ipp_t* answer) {
        removeAttribute(answer, "printer-location");
        setAttribute(answer, IPP_TAG_NAME, "printer-name", "Edited");
    }});
    const auto answer = ask(printer);
    EXPECT_EQ(text(answer, "printer-name"), "Edited");
    EXPECT_FALSE(text(answer, "printer-location"));
}

TEST(ScriptedPrinter, SendsRawValuesAsTheyStand) {
    const std::string longName(10'000, 'n');
    const ScriptedPrinter printer(
        {.rawAttributes = {{IPP_TAG_NAME, "printer-name", longName},
                           {IPP_TAG_TEXT, "printer-info", "bell \a quote \" bad \xff\xfe"},
                           {IPP_TAG_INTEGER, "printer-location", std::string("\0\0\0\7", 4)}}});
    const auto bytes = converse(printer, requestBytes(), 300ms).bytes;
    EXPECT_NE(bytes.find(longName), std::string::npos);
    EXPECT_NE(bytes.find("bell \a quote \" bad \xff\xfe"), std::string::npos);
    EXPECT_NE(bytes.find(rawAttribute(IPP_TAG_INTEGER, "printer-location", std::string("\0\0\0\7", 4))),
              std::string::npos);
    EXPECT_EQ(bytes.find("Lab 3"), std::string::npos) << "the proper value should be replaced";
}

TEST(ScriptedPrinter, ReportsThousandsOfValues) {
    const ScriptedPrinter printer({.edit = [](ipp_t* answer) {
        for (int i = 0; i < 5000; ++i)
            setAttribute(answer, IPP_TAG_KEYWORD, ("x-attribute-" + std::to_string(i)).c_str(), "value");
    }});
    EXPECT_EQ(text(ask(printer), "x-attribute-4999"), "value");
}

TEST(ScriptedPrinter, HasOnlyTheServicesItWasGiven) {
    const ScriptedPrinter printer({.services = {{"/ipp/print", {}}, {"/ipp/faxout", [](ipp_t* answer) {
                                                                         setAttribute(answer, IPP_TAG_NAME,
                                                                                      "printer-name", "Fax");
                                                                     }}}});
    EXPECT_EQ(text(ask(printer), "printer-name"), "Scripted");
    EXPECT_EQ(text(ask(printer, {}, "/ipp/faxout"), "printer-name"), "Fax");
    ask(printer, {}, "/elsewhere");
    EXPECT_EQ(cupsLastError(), IPP_STATUS_ERROR_NOT_FOUND);
}

TEST(ScriptedPrinter, WaitsBeforeItAnswers) {
    const ScriptedPrinter printer({.delay = 300ms});
    const auto begin = Clock::now();
    EXPECT_TRUE(ask(printer));
    EXPECT_GE(Clock::now() - begin, 300ms);
}

TEST(ScriptedPrinter, KeepsAConnectionForSeveralRequests) {
    const ScriptedPrinter printer;
    const auto heard = converse(printer, requestBytes() + requestBytes(), 500ms);
    EXPECT_EQ(printer.requests().size(), 2U);
    EXPECT_EQ(printer.connectionCount(), 1U);
    EXPECT_FALSE(heard.hungUp);
}

TEST(ScriptedPrinter, TakesChunkedRequestsThatExpectAContinue) {
    const ScriptedPrinter printer;
    const auto whole = requestBytes();
    const auto body = whole.substr(whole.find("\r\n\r\n") + 4);
    std::array<char, 16> size{};
    snprintf(size.data(), size.size(), "%zx", body.size());
    const auto heard = converse(printer,
                                "POST /ipp/print HTTP/1.1\r\nTransfer-Encoding: chunked\r\nExpect: "
                                "100-continue\r\n\r\n" +
                                    std::string(size.data()) + "\r\n" + body + "\r\n0\r\n\r\n",
                                300ms);
    EXPECT_TRUE(heard.bytes.starts_with("HTTP/1.1 100 Continue\r\n\r\nHTTP/1.1 200 OK\r\n")) << heard.bytes;
    EXPECT_EQ(printer.requests().size(), 1U);
}

struct FaultCase {
    Fault fault;
    std::string_view name;
    std::string_view begins;  // what the peer hears first; empty = nothing at all
    bool hangsUp;
};

void PrintTo(const FaultCase& row, std::ostream* out) {
    *out << row.name;
}

constexpr FaultCase kFaults[] = {
    {Fault::silent, "silent", "", false},
    {Fault::html, "html", "HTTP/1.1 200 OK\r\nContent-Type: text/html", false},
    {Fault::garbage, "garbage", "\x01\x7f\xfe", true},
    {Fault::garbageThenSilence, "garbageThenSilence", "\x01\x7f\xfe", false},
    {Fault::garbledIpp, "garbledIpp", "HTTP/1.1 200 OK\r\nContent-Type: application/ipp", false},
    {Fault::halfThenSilence, "halfThenSilence", "HTTP/1.1 200 OK\r\n", false},
    {Fault::halfThenClose, "halfThenClose", "HTTP/1.1 200 OK\r\n", true},
    {Fault::notFound, "notFound", "HTTP/1.1 404 Not Found\r\n", false},
    {Fault::unauthorized, "unauthorized", "HTTP/1.1 401 Unauthorized\r\n", false},
    {Fault::closeAtOnce, "closeAtOnce", "", true},
    {Fault::redirect, "redirect", "HTTP/1.1 302 Found\r\n", false},
    {Fault::wrongRequestId, "wrongRequestId", "HTTP/1.1 200 OK\r\n", false},
    {Fault::noAttributes, "noAttributes", "HTTP/1.1 200 OK\r\n", false},
};

class ScriptedFaults : public testing::TestWithParam<FaultCase> {};

INSTANTIATE_TEST_SUITE_P(All, ScriptedFaults, testing::ValuesIn(kFaults),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_P(ScriptedFaults, LookAsTheyAreCalled) {
    const auto& [fault, name, begins, hangsUp] = GetParam();
    const ScriptedPrinter printer({.fault = fault});
    const auto heard = converse(printer, requestBytes(), 200ms);
    EXPECT_EQ(heard.bytes.empty(), begins.empty()) << heard.bytes;
    EXPECT_TRUE(heard.bytes.starts_with(begins)) << heard.bytes;
    EXPECT_EQ(heard.hungUp, hangsUp);
}

TEST_P(ScriptedFaults, ComeAfterTheHealthyRequests) {
    const ScriptedPrinter printer({.fault = GetParam().fault, .healthyRequests = 1});
    const auto healthy = converse(printer, requestBytes(), 100ms);
    EXPECT_NE(healthy.bytes.find("Scripted"), std::string::npos) << healthy.bytes;
    EXPECT_NE(converse(printer, requestBytes(), 100ms).bytes, healthy.bytes);
}

TEST(ScriptedFault, DripSendsOneByteAtATime) {
    const ScriptedPrinter printer({.fault = Fault::drip, .dripInterval = 20ms});
    const auto heard = converse(printer, requestBytes(), 210ms);
    EXPECT_GE(heard.bytes.size(), 3U);
    EXPECT_LE(heard.bytes.size(), 12U);
    EXPECT_TRUE(std::string_view("HTTP/1.1 200 OK").starts_with(heard.bytes.substr(0, 12))) << heard.bytes;
}

TEST(ScriptedFault, HalfIsHalfOfTheProperAnswer) {
    const ScriptedPrinter whole;
    const ScriptedPrinter half({.fault = Fault::halfThenClose});
    const auto request = requestBytes();
    const auto all = converse(whole, request, 200ms).bytes;
    EXPECT_EQ(converse(half, request, 200ms).bytes, all.substr(0, all.size() / 2));
}

TEST(ScriptedFault, SilenceMeetsTlsToo) {
    const ScriptedPrinter silent({.fault = Fault::silent});
    const auto heard = converse(silent, std::string("\x16\x03\x01\x00\x05hello", 10), 200ms);
    EXPECT_EQ(heard.bytes, "");
    EXPECT_FALSE(heard.hungUp);

    const ScriptedPrinter plain;
    EXPECT_TRUE(converse(plain, std::string("\x16\x03\x01\x00\x05hello", 10), 2s).hungUp);
}

TEST(ScriptedFault, WrongRequestIdIsAnswersOnlyFlaw) {
    const ScriptedPrinter printer({.fault = Fault::wrongRequestId});
    const auto heard = converse(printer, requestBytes(), 200ms).bytes;
    const auto answer = decodeIpp(heard.substr(heard.find("\r\n\r\n") + 4));
    ASSERT_TRUE(answer);
    const IppPtr sent{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    EXPECT_GT(ippGetRequestId(answer.get()), ippGetRequestId(sent.get()) + 900);
    EXPECT_EQ(text(answer, "printer-name"), "Scripted");
}

TEST(ScriptedFault, NoAttributesIsASuccessWithoutAnything) {
    const ScriptedPrinter printer({.fault = Fault::noAttributes});
    const auto answer = ask(printer);
    ASSERT_TRUE(answer) << cupsLastErrorString();
    EXPECT_EQ(ippGetStatusCode(answer.get()), IPP_STATUS_OK);
    EXPECT_EQ(ippFirstAttribute(answer.get()), nullptr);
}

TEST(ScriptedFault, AllAreInTheTable) {
    for (const auto& [fault, name] : allFaults()) {
        const bool known =
            fault == Fault::drip ||
            std::ranges::any_of(kFaults, [fault = fault](const auto& row) { return row.fault == fault; });
        EXPECT_TRUE(known) << name;
    }
}

TEST(ScriptedPrinter, ComesInHundreds) {
    std::vector<std::unique_ptr<ScriptedPrinter>> printers;
    for (int i = 0; i < 200; ++i)
        printers.push_back(
            std::make_unique<ScriptedPrinter>(ScriptedPrinterOptions{.name = std::to_string(i)}));
    for (std::size_t i = 0; i < printers.size(); ++i)
        EXPECT_EQ(text(ask(*printers[i], {"printer-name"}), "printer-name"), std::to_string(i));
}

TEST(ScriptedPrinter, StopsInTheMiddleOfAnAnswer) {
    const int socket = [] {
        const ScriptedPrinter printer({.fault = Fault::drip});
        const int client = connectToLoopback(LoopbackAddress::v4, printer.port());
        const auto request = requestBytes();
        send(client, request.data(), request.size(), MSG_NOSIGNAL);
        hear(client, 50ms);
        return client;
    }();
    EXPECT_TRUE(hear(socket, 5s).hungUp);
    close(socket);
}

TEST(BlackHole, NeverCompletesAConnection) {
    const BlackHole hole;
    const auto begin = Clock::now();
    const HttpPtr http{
        httpConnect2("127.0.0.1", hole.port(), nullptr, AF_INET, HTTP_ENCRYPTION_NEVER, 1, 400, nullptr)};
    EXPECT_FALSE(http);
    EXPECT_GE(Clock::now() - begin, 350ms);
}

}  // namespace
}  // namespace ventras
