#include "platform/IppConnection.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>
#include <string_view>
#include <thread>

#include "platform/TemporaryFile.h"
#include "tests/parts/BlackHole.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_view_literals;
using Clock = std::chrono::steady_clock;

constexpr auto kShort = 1s;

IppPtr attributesRequest() {
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/ipp/print");
    return request;
}

IppConnection connectTo(const ScriptedPrinter& printer, std::chrono::milliseconds limit = kShort) {
    return IppConnection::toPrinter("127.0.0.1", printer.port(), HTTP_ENCRYPTION_IF_REQUESTED, limit);
}

std::string textOf(const IppAnswer& answer, const char* name) {
    auto* attribute = ippFindAttribute(answer.response.get(), name, IPP_TAG_ZERO);
    const char* text = attribute != nullptr ? ippGetString(attribute, 0, nullptr) : nullptr;
    return text != nullptr ? text : "";
}

TEST(IppConnection, BringsAnAnswer) {
    const ScriptedPrinter printer({.name = "Here"});
    auto connection = connectTo(printer);
    ASSERT_TRUE(connection.connected()) << connection.failure();
    const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
    EXPECT_TRUE(answer.succeeded()) << answer.reason;
    EXPECT_EQ(textOf(answer, "printer-name"), "Here");
    EXPECT_EQ(printer.requests().at(0).resource, "/ipp/print");
}

TEST(IppConnection, ServesSeveralExchanges) {
    const ScriptedPrinter printer;
    auto connection = connectTo(printer);
    for (int i = 0; i < 3; ++i)
        EXPECT_TRUE(connection.exchange(attributesRequest(), "/ipp/print").succeeded()) << i;
    EXPECT_EQ(printer.connectionCount(), 1U);
}

TEST(IppConnection, TakesAnIPv6Literal) {
    const ScriptedPrinter printer({.listensOnIPv4 = false, .listensOnIPv6 = true});
    auto connection = IppConnection::toPrinter("::1", printer.port(), HTTP_ENCRYPTION_IF_REQUESTED, kShort);
    ASSERT_TRUE(connection.connected()) << connection.failure();
    EXPECT_TRUE(connection.exchange(attributesRequest(), "/ipp/print").succeeded());
}

TEST(IppConnection, TriesEveryAddressOfAHost) {
    const ScriptedPrinter printer({.listensOnIPv4 = false, .listensOnIPv6 = true});
    const auto connection =
        IppConnection::toPrinter("localhost", printer.port(), HTTP_ENCRYPTION_IF_REQUESTED, kShort);
    EXPECT_TRUE(connection.connected()) << connection.failure();
}

TEST(IppConnection, SpeaksTlsWithASelfSignedPrinter) {
    const VirtualPrinter printer({.name = "Secret"});
    auto connection = IppConnection::toPrinter("localhost", printer.port(), HTTP_ENCRYPTION_ALWAYS, 10s);
    ASSERT_TRUE(connection.connected()) << connection.failure();
    const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
    EXPECT_TRUE(answer.succeeded()) << answer.reason;
    EXPECT_EQ(textOf(answer, "printer-name"), "Secret");
}

TEST(IppConnection, GivesThePrintersRefusalAsItStands) {
    const ScriptedPrinter printer({.services = {{"/ipp/print", {}}}});
    auto connection = connectTo(printer);
    const auto answer = connection.exchange(attributesRequest(), "/ipp/faxout");
    EXPECT_FALSE(answer.succeeded());
    EXPECT_EQ(answer.status, IPP_STATUS_ERROR_NOT_FOUND);
    EXPECT_FALSE(answer.reason.empty());
}

struct UnreachableCase {
    const char* host;
    http_encryption_t encryption;
    const char* reason;
};

TEST(IppConnection, TellsWhyNobodyIsThere) {
    constexpr UnreachableCase kCases[] = {
        {"127.0.0.1", HTTP_ENCRYPTION_IF_REQUESTED, "Connection refused"},
        {"::1", HTTP_ENCRYPTION_IF_REQUESTED, "Connection refused"},
        {"localhost", HTTP_ENCRYPTION_IF_REQUESTED, "Connection refused"},
        {"127.0.0.1", HTTP_ENCRYPTION_ALWAYS, "Connection refused"},
        {"/nonexistent/socket", HTTP_ENCRYPTION_IF_REQUESTED, "No such file or directory"},
    };
    for (const auto& [host, encryption, reason] : kCases) {
        auto connection = IppConnection::toPrinter(host, freePort(), encryption, kShort);
        EXPECT_FALSE(connection.connected()) << host;
        EXPECT_EQ(connection.failure(), reason) << host;
        const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
        EXPECT_EQ(answer.response, nullptr);
        EXPECT_EQ(answer.status, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE);
        EXPECT_EQ(answer.reason, connection.failure());
    }
}

TEST(IppConnection, TellsWhenAHostHasNoAddress) {
    for (const auto* host : {"no-such-host.invalid", "", "a b", "1.2.3.4.5"}) {
        const auto connection =
            IppConnection::toPrinter(host, freePort(), HTTP_ENCRYPTION_IF_REQUESTED, kShort);
        EXPECT_FALSE(connection.connected()) << host;
        EXPECT_FALSE(connection.failure().empty()) << host;
    }
}

TEST(IppConnection, TellsWhenAPrinterDoesNotSpeakTls) {
    const ScriptedPrinter plain;
    const auto connection =
        IppConnection::toPrinter("127.0.0.1", plain.port(), HTTP_ENCRYPTION_ALWAYS, kShort);
    EXPECT_FALSE(connection.connected());
    EXPECT_EQ(connection.failure(), "it does not speak TLS");
}

TEST(IppConnection, GivesUpConnectingAfterItsLimit) {
    const BlackHole hole;
    const ScriptedPrinter silent({.fault = Fault::silent});
    const auto attempt = [](int port, http_encryption_t encryption) {
        const auto begin = Clock::now();
        const auto connection = IppConnection::toPrinter("127.0.0.1", port, encryption, kShort);
        EXPECT_FALSE(connection.connected());
        EXPECT_EQ(connection.failure(), "no connection within 10 s");
        EXPECT_GE(Clock::now() - begin, IppConnection::kConnectLimit - 1s);
        EXPECT_LT(Clock::now() - begin, IppConnection::kConnectLimit + 1s);
    };
    std::jthread neverConnects(attempt, hole.port(), HTTP_ENCRYPTION_IF_REQUESTED);
    std::jthread neverHandshakes(attempt, silent.port(), HTTP_ENCRYPTION_ALWAYS);
}

struct FaultCase {
    Fault fault;
    bool waits;  // the limit ends it, not the printer
    bool succeeds;
};

constexpr FaultCase kFaults[] = {
    {Fault::silent, true, false},
    {Fault::drip, true, false},
    {Fault::html, false, false},
    {Fault::garbage, false, false},
    {Fault::garbageThenSilence, true, false},
    {Fault::garbledIpp, false, false},
    {Fault::halfThenSilence, true, false},
    {Fault::halfThenClose, false, false},
    {Fault::notFound, false, false},
    {Fault::unauthorized, false, false},
    {Fault::closeAtOnce, false, false},
    {Fault::redirect, false, false},
    // Nothing is wrong with these as HTTP and IPP exchanges go.
    {Fault::wrongRequestId, false, true},
    {Fault::noAttributes, false, true},
};

void PrintTo(const FaultCase& row, std::ostream* out) {
    for (const auto& [fault, name] : allFaults())
        if (fault == row.fault)
            *out << name;
}

class FaultyPrinters : public testing::TestWithParam<FaultCase> {};

INSTANTIATE_TEST_SUITE_P(All, FaultyPrinters, testing::ValuesIn(kFaults),
                         [](const auto& test) { return testing::PrintToString(test.param); });

TEST_P(FaultyPrinters, EndTheExchangeWithinItsLimit) {
    const auto& [fault, waits, succeeds] = GetParam();
    const ScriptedPrinter printer({.fault = fault, .dripInterval = 100ms});
    const auto begin = Clock::now();
    auto connection = connectTo(printer);
    const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
    const auto time = Clock::now() - begin;

    EXPECT_EQ(answer.succeeded(), succeeds) << answer.reason;
    EXPECT_LT(time, kShort + 500ms);
    EXPECT_EQ(time >= kShort, waits) << answer.reason;
    EXPECT_EQ(succeeds, answer.response != nullptr);
    if (!succeeds) {
        EXPECT_FALSE(answer.reason.empty());
    }
    if (waits) {
        EXPECT_EQ(answer.reason, "no complete answer within 1 s");
    }
    // A printer that answers badly is asked again a time or two by libcups, not for as long as the limit
    // lasts.
    EXPECT_LE(printer.requests().size(), 4U);
}

TEST_P(FaultyPrinters, DoNotSpoilWhatCameBefore) {
    const ScriptedPrinter printer({.fault = GetParam().fault, .healthyRequests = 1, .dripInterval = 100ms});
    auto connection = connectTo(printer);
    ASSERT_TRUE(connection.exchange(attributesRequest(), "/ipp/print").succeeded());
    const auto begin = Clock::now();
    EXPECT_EQ(connection.exchange(attributesRequest(), "/ipp/print").succeeded(), GetParam().succeeds);
    EXPECT_LT(Clock::now() - begin, kShort + 500ms);
}

TEST(IppConnection, AllowsAnAnswerJustBeforeTheLimit) {
    const ScriptedPrinter printer({.delay = 2500ms});
    auto connection = connectTo(printer, 4s);
    const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
    EXPECT_TRUE(answer.succeeded()) << answer.reason;
}

TEST(IppConnection, GivesThePrintersOwnReason) {
    const ScriptedPrinter printer({.status = IPP_STATUS_ERROR_BUSY, .statusMessage = "out to lunch"});
    auto connection = connectTo(printer);
    const auto answer = connection.exchange(attributesRequest(), "/ipp/print");
    EXPECT_EQ(answer.status, IPP_STATUS_ERROR_BUSY);
    EXPECT_EQ(answer.reason, "out to lunch");
    EXPECT_TRUE(answer.response);
}

struct RefusalCase {
    Fault fault;
    ipp_status_t status;
    const char* reason;
};

TEST(IppConnection, TranslatesWhatHttpRefuses) {
    constexpr RefusalCase kCases[] = {
        {Fault::notFound, IPP_STATUS_ERROR_NOT_FOUND, "HTTP 404 Not Found"},
        {Fault::redirect, IPP_STATUS_ERROR_INTERNAL, "HTTP 302 Found"},
        {Fault::unauthorized, IPP_STATUS_ERROR_CUPS_AUTHENTICATION_CANCELED, "a password is asked for"},
    };
    for (const auto& [fault, status, reason] : kCases) {
        const ScriptedPrinter printer({.fault = fault});
        const auto answer = connectTo(printer).exchange(attributesRequest(), "/ipp/print");
        EXPECT_EQ(answer.status, status) << reason;
        EXPECT_EQ(answer.reason, reason);
    }
}

TEST(IppConnection, TransfersDocumentsBothWays) {
    const PrivateScheduler scheduler;
    const UseScheduler use(scheduler);
    const auto ppd = readFile(testDocument("colour-duplex.ppd"));

    auto upload = TemporaryFile::create();
    ASSERT_TRUE(upload);
    std::ofstream(upload->path()) << ppd;
    IppPtr add{ippNewRequest(IPP_OP_CUPS_ADD_MODIFY_PRINTER)};
    ippAddString(add.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/Q");
    ippAddString(add.get(), IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, "usb://Acme/ColorJet");
    auto connection = IppConnection::toScheduler(10s);
    ASSERT_TRUE(connection.connected()) << connection.failure();
    const auto added = connection.exchange(std::move(add), "/admin/", upload->descriptor());
    ASSERT_TRUE(added.succeeded()) << added.reason;
    EXPECT_EQ(scheduler.ppd("Q"), ppd);

    auto download = TemporaryFile::create();
    ASSERT_TRUE(download);
    IppPtr get{ippNewRequest(IPP_OP_CUPS_GET_PPD)};
    ippAddString(get.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/Q");
    const auto got = connection.exchange(std::move(get), "/", -1, download->descriptor());
    ASSERT_TRUE(got.succeeded()) << got.reason;
    EXPECT_EQ(readFile(download->path()), ppd);
}

TEST(IppConnection, RefusesADocumentThatEndsTooEarly) {
    const std::string document(100'000, 'x');
    const ScriptedPrinter whole({.document = document});
    const ScriptedPrinter half({.document = document, .fault = Fault::halfThenClose});
    auto file = TemporaryFile::create();
    ASSERT_TRUE(file);
    const auto complete = connectTo(whole).exchange(attributesRequest(), "/", -1, file->descriptor());
    EXPECT_TRUE(complete.succeeded()) << complete.reason;
    EXPECT_EQ(readFile(file->path()), document);

    const auto answer = connectTo(half).exchange(attributesRequest(), "/", -1, file->descriptor());
    EXPECT_FALSE(answer.succeeded());
    EXPECT_EQ(answer.response, nullptr);
    EXPECT_EQ(answer.reason, "the document that came back is incomplete");
}

TEST(IppConnection, RefusesADocumentThatStops) {
    const ScriptedPrinter printer({.document = std::string(100'000, 'x'), .fault = Fault::halfThenSilence});
    auto file = TemporaryFile::create();
    ASSERT_TRUE(file);
    const auto answer = connectTo(printer).exchange(attributesRequest(), "/", -1, file->descriptor());
    EXPECT_FALSE(answer.succeeded());
    EXPECT_EQ(answer.reason, "no complete answer within 1 s");
}

TEST(IppConnection, RefusesADocumentThatCannotBeKept) {
    const ScriptedPrinter printer({.document = std::string(100'000, 'x')});
    const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
    const auto answer = connectTo(printer).exchange(attributesRequest(), "/", -1, full);
    close(full);
    EXPECT_FALSE(answer.succeeded());
}

class SchedulerConnections : public testing::TestWithParam<bool> {};

INSTANTIATE_TEST_SUITE_P(All, SchedulerConnections, testing::Bool(),
                         [](const auto& test) { return test.param ? "Tcp" : "Socket"; });

IppPtr queuesRequest() {
    return IppPtr{ippNewRequest(IPP_OP_CUPS_GET_PRINTERS)};
}

TEST_P(SchedulerConnections, SurviveARestart) {
    PrivateScheduler scheduler({.listensOnTcp = GetParam()});
    scheduler.addQueue("Q", "usb://Acme/ColorJet");
    const UseScheduler use(scheduler);
    auto connection = IppConnection::toScheduler(10s);
    ASSERT_TRUE(connection.exchange(queuesRequest(), "/").succeeded());
    scheduler.stop();
    EXPECT_FALSE(connection.exchange(queuesRequest(), "/").succeeded());
    scheduler.start();
    EXPECT_TRUE(connection.exchange(queuesRequest(), "/").succeeded());
}

TEST(SchedulerConnection, DoesNotWaitAsLongAgainForAFrozenOne) {
    PrivateScheduler scheduler;
    const UseScheduler use(scheduler);
    scheduler.suspend();
    EXPECT_FALSE(IppConnection::toScheduler(200ms).exchange(queuesRequest(), "/").succeeded());
    const auto begin = std::chrono::steady_clock::now();
    EXPECT_FALSE(IppConnection::toScheduler(60s).exchange(queuesRequest(), "/").succeeded());
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 20s);

    scheduler.resume();
    scheduler.addQueue("Q", "usb://Acme/ColorJet");
    EXPECT_TRUE(IppConnection::toScheduler(60s).exchange(queuesRequest(), "/").succeeded());
    EXPECT_TRUE(IppConnection::toScheduler(60s).exchange(queuesRequest(), "/").succeeded());
}

TEST_P(SchedulerConnections, DoNotWaitForAFrozenOne) {
    PrivateScheduler scheduler({.listensOnTcp = GetParam()});
    const UseScheduler use(scheduler);
    scheduler.suspend();
    const auto begin = Clock::now();
    auto connection = IppConnection::toScheduler(kShort);
    const auto answer = connection.exchange(queuesRequest(), "/");
    EXPECT_FALSE(answer.succeeded());
    EXPECT_EQ(answer.reason, "no complete answer within 1 s");
    EXPECT_LT(Clock::now() - begin, kShort + 500ms);
    scheduler.resume();
}

TEST_P(SchedulerConnections, NoticeADeadOneAtOnce) {
    PrivateScheduler scheduler({.listensOnTcp = GetParam()});
    const UseScheduler use(scheduler);
    auto connection = IppConnection::toScheduler(10s);
    scheduler.suspend();
    std::jthread killer([&] {
        std::this_thread::sleep_for(200ms);
        scheduler.kill();
    });
    const auto begin = Clock::now();
    EXPECT_FALSE(connection.exchange(queuesRequest(), "/").succeeded());
    EXPECT_LT(Clock::now() - begin, 5s);
}

TEST(IppConnection, TellsThatThereIsNoScheduler) {
    const UseScheduler use("/nonexistent/socket");
    auto connection = IppConnection::toScheduler(kShort);
    EXPECT_FALSE(connection.connected());
    EXPECT_EQ(connection.failure(), "No such file or directory");
    EXPECT_FALSE(connection.exchange(queuesRequest(), "/").succeeded());
}

TEST(IppConnection, AsksNobodyForAPassword) {
    const PrivateScheduler scheduler(
        {.policy = SchedulerPolicy::stock,
         .listensOnTcp = true,
         .user = ordinaryUser(),
         .printers = "<Printer Q>\nDeviceURI usb://Acme/Old\nState Idle\n</Printer>\n"});
    const UseScheduler use(scheduler);
    IppPtr remove{ippNewRequest(IPP_OP_CUPS_DELETE_PRINTER)};
    ippAddString(remove.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/Q");
    auto connection = IppConnection::toScheduler(5s);
    const auto begin = Clock::now();
    const auto answer = connection.exchange(std::move(remove), "/admin/");
    EXPECT_EQ(answer.status, IPP_STATUS_ERROR_CUPS_AUTHENTICATION_CANCELED) << answer.reason;
    EXPECT_LT(Clock::now() - begin, 2s);
    EXPECT_EQ(scheduler.queues(), std::vector<std::string>{"Q"});
}

TEST(IppConnection, ProvesItsUserToASchedulerOnASocket) {
    PrivateScheduler scheduler(
        {.policy = SchedulerPolicy::stock,
         .printers = "<Printer Q>\nDeviceURI usb://Acme/Old\nState Idle\n</Printer>\n"});
    const UseScheduler use(scheduler);
    IppPtr remove{ippNewRequest(IPP_OP_CUPS_DELETE_PRINTER)};
    ippAddString(remove.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/Q");
    const auto answer = IppConnection::toScheduler(5s).exchange(std::move(remove), "/admin/");
    EXPECT_TRUE(answer.succeeded()) << answer.reason;
    EXPECT_EQ(scheduler.queues(), std::vector<std::string>{});
}

}  // namespace
}  // namespace ventras
