#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"

// Arguments that try to reach something else than a printer, or to be something else than they look like.

namespace ventras {
namespace {

using testing::AnyOf;
using testing::HasSubstr;

constexpr int kNoDevice = 255;

class UriTricks : public HostileRun {
protected:
    /// "HOST:PORT" of a printer that answers whatever resource it is asked for.
    std::string authority() const { return "127.0.0.1:" + std::to_string(printer_.port()); }

    ScriptedPrinter printer_{{.name = "Victim"}};
    Agent agent_{scheduler_};
};

TEST_F(UriTricks, OfOtherSchemesAreNoDevices) {
    for (const std::string scheme : {"file", "socket", "http", "https", "lpd", "smb", "usb", "mdns", "dnssd",
                                     "IPP", "ipp ", "javascript"}) {
        const auto run = agent_.run({scheme + "://" + authority() + "/ipp/print"});
        EXPECT_EQ(run.exitStatus, kNoDevice) << scheme << run.story();
        EXPECT_EQ(run.standardError, "") << scheme;
    }
    for (const auto* argument :
         {"file:///etc/passwd", "ipp:/etc/passwd", "ipp:", "//etc/passwd", "ipp:\\\\host\\x"})
        EXPECT_EQ(agent_.run({argument}).exitStatus, kNoDevice) << argument;
    EXPECT_EQ(printer_.connectionCount(), 0U);
    EXPECT_EQ(newQueues(), Names{});
}

// None of these names a printer that can be reached.
TEST_F(UriTricks, WithoutAProperAuthorityReachNobody) {
    const Names tricks{
        "ipp://",
        "ipp:///etc/passwd",
        "ipp:///ipp/print",
        "ipp://@/",
        "ipp://:631/",
        "ipp://[::1/ipp/print",
        "ipp://[127.0.0.1]:" + std::to_string(printer_.port()) + "x/",
        "ipp://127.0.0.1:0/",
        "ipp://127.0.0.1:-1/",
        "ipp://127.0.0.1:99999999999999999999/",
        "ipp://127.0.0.1%0a:" + std::to_string(printer_.port()) + "/",
        "ipp://127.0.0.1 :" + std::to_string(printer_.port()) + "/",
        "ipp:///var/run/cups/cups.sock/",
        "ipp://%2fvar%2frun%2fcups%2fcups.sock/",
        "ipp://" + scheduler_.address() + "/",
        "ipp://" + std::string(3000, 'a') + "/",
        "ipps://\n/",
    };
    const auto run = agent_.run(tricks);
    EXPECT_EQ(run.exitStatus, kNoDevice) << run.story();
    EXPECT_EQ(newQueues(), Names{});
    expectHarmless(agent_, run);
}

struct ResourceCase {
    const char* name;
    std::string beforeHost, behindPort;
    int status;
};

// The printer answers at each of them: what counts is that a queue's device URI is the one that was ordered,
// of a scheme without a file behind it, or that there is no queue.
TEST_F(UriTricks, InUserAndResourceMakeNoOtherDevice) {
    const ResourceCase cases[] = {
        {"path to the parent", "", "/../../etc/passwd", 0},
        {"encoded path to the parent", "", "/%2e%2e/%2e%2e/etc/passwd", 0},
        {"encoded NUL", "", "/ipp/print%00.pdf", 0},
        {"encoded line end", "", "/ipp/print%0d%0aX-Header:%20evil", 0},
        {"line end", "", "/ipp/print\r\nX-Header: evil", 65},
        {"quotation mark", "", "/ipp/\"print", 0},
        {"query", "", "/ipp/print?waitjob=false&waitprinter=false", 0},
        {"fragment", "", "/ipp/print#/admin", 0},
        {"user", "root@", "/ipp/print", 0},
        {"user and password", "root:secret@", "/ipp/print", 0},
        {"another host as user", "printer.example@", "/ipp/print", 0},
        {"very long", "", "/" + std::string(1500, 'a'), 65},
    };
    for (const auto& [name, beforeHost, behindPort, status] : cases) {
        const auto uri = "ipp://" + beforeHost + authority() + behindPort;
        const auto run = agent_.run({uri});
        EXPECT_EQ(run.exitStatus, status) << name << '\n' << run.story();
        EXPECT_EQ(newQueues().size(), status == 0 ? 1U : 0U) << name << '\n' << run.story();
        for (const auto& queue : newQueues()) {
            EXPECT_THAT(scheduler_.attribute(queue, "device-uri"),
                        AnyOf(uri, "ipp://" + authority() + behindPort))
                << name;
            scheduler_.deleteQueue(queue);
        }
        expectHarmless(agent_, run);
    }
}

TEST_F(UriTricks, OfIppOverUsbNameNoHost) {
    const auto run = agent_.run(
        {"ippusb://", "ippusb://" + authority() + "/ipp/print", "ippusb://../../etc/passwd", "ippusb://a%00b",
         "ippusb://x\n*cupsFilter: evil", "ippusb://\"; reboot; \"", "ippusb://" + std::string(5000, 'n'),
         "ippusb://\xe2\x80\xae"
         "fdp"});
    EXPECT_EQ(run.exitStatus, 0) << run.story();  // nobody of that name: nothing to do
    EXPECT_EQ(printer_.connectionCount(), 0U);
    EXPECT_EQ(newQueues(), Names{});
    expectHarmless(agent_, run);
}

// A decoded path goes into the first line of a request.
TEST_F(UriTricks, ThatAreEncodedMakeNoOtherRequest) {
    agent_.run({"ipp://" + authority() + "/ipp/print%0d%0aX-Header:%20evil%00%1b%7f"});
    ASSERT_FALSE(printer_.requests().empty());
    for (const auto& request : printer_.requests())
        EXPECT_EQ(request.resource, "/ipp/print%0D%0AX-Header:%20evil");
}

// What stands behind the NUL is nobody's: neither a name server nor another host is asked.
TEST_F(UriTricks, InAHostEndItAtANul) {
    const auto uri = "ipp://127.0.0.1%00.invalid:" + std::to_string(printer_.port()) + "/ipp/print";
    const auto run = agent_.run({uri});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(newQueues(), Names{"Victim"});
    EXPECT_EQ(scheduler_.attribute("Victim", "device-uri"), uri);
    expectHarmless(agent_, run);
}

TEST_F(UriTricks, InArgumentsThatAreNoTextAreIgnored) {
    const auto run =
        agent_.run({"ipp://" + authority() + "/\xff\xfe", "-u\xff", "--scanner\xc0\xaf,,,,USB,1,2,3"});
    EXPECT_EQ(run.exitStatus, kNoDevice) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr("no UTF-8"));
    EXPECT_EQ(printer_.connectionCount(), 0U);
    expectHarmless(agent_, run);
}

TEST_F(UriTricks, OfUsbLocationsFindNothing) {
    for (const auto* location : {"-u", "-u,", "-u0", "-u-1,-1", "-u99999999999999999999,0", "-u0x1400000,0",
                                 "-u20971520,99999999999", "-u%n%n,%s", "-u../../../dev/bus/usb/001/001"}) {
        const auto run = agent_.run({location});
        EXPECT_EQ(run.exitStatus, kNoDevice) << location << run.story();
        expectHarmless(agent_, run);
    }
}

}  // namespace
}  // namespace ventras
