#include "platform/linux/options/IppOptionSelection.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <set>
#include <thread>

#include "platform/linux/options/AutoSelect.h"
#include "platform/linux/ppd/DriverRules.h"
#include "platform/linux/ppd/PpdFile.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/BlackHole.h"
#include "tests/parts/OpenedPpd.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::Not;

const std::string kGeneric = "/tmp/generic.ppd";
const std::string kGenericFax = "/tmp/genericVellumFax.ppd";

struct Selection {
    std::int32_t status = -1;
    std::string ppd;  // the new one's text; empty = none
    std::vector<std::string> log;
};

std::string pathIn(const std::string& url) {
    EXPECT_TRUE(url.starts_with("file:///")) << url;
    return url.substr(std::string("file://").size());
}

Selection select(const std::string& uri, const std::string& ppdPath = kGeneric) {
    FakeLog log;
    const auto context = makeAutoSelectContext(uri, log);
    Selection selection;
    selection.status = context->autoSelectInstallableOptions(ppdPath);
    if (const auto url = context->autoSelectHasNewPPD()) {
        selection.ppd = readFile(pathIn(*url));
        EXPECT_NE(selection.ppd, "");
        std::filesystem::remove(pathIn(*url));
    }
    selection.log = log.lines();
    return selection;
}

// The choices of one option of a PPD, as libcups reads them.
std::set<std::string> choices(const std::string& text, const char* option) {
    const auto ppd = openedPpd(text);
    std::set<std::string> found;
    const auto* entry = ppd ? ppdFindOption(ppd.get(), option) : nullptr;
    for (int i = 0; entry != nullptr && i < entry->num_choices; ++i)
        found.emplace(entry->choices[i].choice);
    return found;
}

std::string attribute(const std::string& text, const char* keyword) {
    const auto ppd = openedPpd(text);
    const auto* entry = ppd ? ppdFindAttr(ppd.get(), keyword, nullptr) : nullptr;
    return entry == nullptr || entry->value == nullptr ? "" : entry->value;
}

bool isSafe(const std::string& text) {
    const TemporaryFolder folder;
    const auto objection =
        objectionToDriver(PpdFile::open(folder.write("x.ppd", text).string()), DriverKind::Driverless);
    EXPECT_FALSE(objection) << *objection;
    return !objection;
}

TEST(IppOptionSelection, GivesAColourDuplexPrinterWhatItHas) {
    const VirtualPrinter printer{{.duplex = true, .colour = true}};
    const auto selection = select(printer.uri());
    EXPECT_EQ(selection.status, 0);
    EXPECT_THAT(selection.log, IsEmpty());
    EXPECT_TRUE(isSafe(selection.ppd));
    EXPECT_EQ(choices(selection.ppd, "ColorModel"), (std::set<std::string>{"RGB", "Gray"}));
    EXPECT_EQ(choices(selection.ppd, "Duplex"),
              (std::set<std::string>{"None", "DuplexNoTumble", "DuplexTumble"}));
    EXPECT_THAT(choices(selection.ppd, "InputSlot"), testing::Contains("Photo"));
    EXPECT_THAT(choices(selection.ppd, "MediaType"), testing::Contains("PhotographicGlossy"));
    EXPECT_THAT(choices(selection.ppd, "PageSize"), IsSupersetOf({"A4", "Letter"}));
    EXPECT_EQ(attribute(selection.ppd, "cupsSNMPSupplies"), "False");
    EXPECT_EQ(attribute(selection.ppd, "DefaultResolution"), "600dpi");
    EXPECT_THAT(attribute(selection.ppd, "NickName"), HasSubstr("Acme Laser"));
    EXPECT_EQ(attribute(selection.ppd, "cupsFax"), "");
}

TEST(IppOptionSelection, GivesAPlainPrinterNeitherColourNorDuplex) {
    const VirtualPrinter printer;
    const auto selection = select(printer.uri());
    EXPECT_TRUE(isSafe(selection.ppd));
    EXPECT_EQ(choices(selection.ppd, "ColorModel"), std::set<std::string>{"Gray"});
    EXPECT_EQ(choices(selection.ppd, "Duplex"), std::set<std::string>{});
}

TEST(IppOptionSelection, OffersTheSizesOfTheVeryPrinterAndNoOthers) {
    const ScriptedPrinter printer;
    EXPECT_EQ(choices(select(printer.uri()).ppd, "PageSize"), (std::set<std::string>{"A4", "Letter"}));
}

TEST(IppOptionSelection, TalksToAPrinterOverTls) {
    const VirtualPrinter printer;
    const auto selection = select(printer.uri("ipps"));
    EXPECT_THAT(selection.log, IsEmpty());
    EXPECT_TRUE(isSafe(selection.ppd));
}

TEST(IppOptionSelection, NeverTalksToAnIppsPrinterWithoutTls) {
    const ScriptedPrinter printer;  // does not speak TLS
    const auto selection = select(printer.uri("ipps"));
    EXPECT_EQ(selection.status, 0);
    EXPECT_EQ(selection.ppd, "");
    EXPECT_THAT(printer.requests(), IsEmpty());
}

TEST(IppOptionSelection, AsksThePrinterOnce) {
    const ScriptedPrinter printer;
    ASSERT_NE(select(printer.uri()).ppd, "");
    const auto requests = printer.requests();
    ASSERT_EQ(requests.size(), 1U);
    EXPECT_EQ(requests.front().operation, IPP_OP_GET_PRINTER_ATTRIBUTES);
    EXPECT_EQ(requests.front().resource, "/ipp/print");
    EXPECT_EQ(requests.front().printerUri, printer.uri());
    EXPECT_THAT(requests.front().requestedAttributes, ElementsAre("all", "media-col-database"));
    EXPECT_EQ(printer.connectionCount(), 1U);
}

TEST(IppOptionSelection, MakesAFaxDriverFromTheFaxService) {
    const ScriptedPrinter printer({.services = {{"/ipp/print", {}}, {"/ipp/faxout", {}}}});
    const auto selection = select(printer.uri(), kGenericFax);
    EXPECT_TRUE(isSafe(selection.ppd));
    EXPECT_EQ(attribute(selection.ppd, "cupsFax"), "True");
    ASSERT_EQ(printer.requests().size(), 1U);
    EXPECT_EQ(printer.requests().front().resource, "/ipp/faxout");
    EXPECT_THAT(printer.requests().front().printerUri, testing::EndsWith("/ipp/faxout"));
}

TEST(IppOptionSelection, MakesNoFaxDriverWithoutAFaxService) {
    const VirtualPrinter printer;
    const auto selection = select(printer.uri(), kGenericFax);
    EXPECT_EQ(selection.status, 0);
    EXPECT_EQ(selection.ppd, "");
}

TEST(IppOptionSelection, MakesAFaxQueueThatTheSchedulerTakesForOne) {
    const ScriptedPrinter printer;
    const PrivateScheduler scheduler;
    scheduler.addQueue("Fax", printer.uri(), select(printer.uri(), kGenericFax).ppd);
    EXPECT_NE(std::stoul(scheduler.attribute("Fax", "printer-type")) & 0x40000U, 0U);
}

TEST(IppOptionSelection, LeavesTheDriverOfADeviceThatCannotBeAsked) {
    for (const auto* uri : {"mdns://uuid", "bluetooth://uuid", "file:///dev/null", "nonsense", ""}) {
        const auto selection = select(uri);
        EXPECT_EQ(selection.status, 0) << uri;
        EXPECT_EQ(selection.ppd, "") << uri;
        EXPECT_THAT(selection.log, IsEmpty()) << uri;
    }
}

TEST(IppOptionSelection, LeavesTheDriverWhenTheAddressMakesNoSense) {
    for (const auto* uri : {"ipp://", "ipp:///ipp/print", "ipp://[::1", "ipp://host:port/", "ippusb://Laser/",
                            "ippusb://No%20Such._ipp._tcp.local./", "ipp://127.0.0.1:1/ipp/print"}) {
        const auto selection = select(uri);
        EXPECT_EQ(selection.status, 0) << uri;
        EXPECT_EQ(selection.ppd, "") << uri;
        EXPECT_THAT(selection.log, ElementsAre(HasSubstr(uri))) << uri;
    }
}

// Printers that keep us waiting are in a test of their own.
bool isSlow(Fault fault) {
    return std::ranges::any_of(
        std::array{Fault::silent, Fault::drip, Fault::halfThenSilence, Fault::garbageThenSilence},
        [fault](Fault slow) { return slow == fault; });
}

TEST(IppOptionSelection, LeavesTheDriverWhenThePrinterTalksNonsense) {
    for (const auto& [fault, name] : allFaults()) {
        // libcups takes an answer whatever number its request had.
        if (fault == Fault::none || fault == Fault::wrongRequestId || isSlow(fault))
            continue;
        const ScriptedPrinter printer({.fault = fault});
        const auto selection = select(printer.uri());
        EXPECT_EQ(selection.status, 0) << name;
        EXPECT_EQ(selection.ppd, "") << name;
        EXPECT_EQ(selection.log.size(), 1U) << name << testing::PrintToString(selection.log);
    }
}

TEST(IppOptionSelection, LeavesNoFileWhenNobodyAsksForIt) {
    const TemporaryFolder folder;
    ASSERT_EQ(setenv("TMPDIR", folder.path().c_str(), 1), 0);
    const ScriptedPrinter printer;
    FakeLog log;
    {
        const auto context = makeAutoSelectContext(printer.uri(), log);
        EXPECT_EQ(context->autoSelectInstallableOptions(kGeneric), 0);
    }
    unsetenv("TMPDIR");
    EXPECT_TRUE(std::filesystem::is_empty(folder.path()));
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST(IppOptionSelection, NamesTheSameFileEachTimeItIsAsked) {
    const ScriptedPrinter printer;
    FakeLog log;
    const auto context = makeAutoSelectContext(printer.uri(), log);
    ASSERT_EQ(context->autoSelectInstallableOptions(kGeneric), 0);
    const auto url = context->autoSelectHasNewPPD();
    ASSERT_TRUE(url);
    EXPECT_EQ(context->autoSelectHasNewPPD(), url);
    std::filesystem::remove(pathIn(*url));
}

TEST(IppOptionSelection, KeepsTheBinaryFlag) {
    FakeLog log;
    for (const auto* uri : {"ipp://host/ipp/print", "usb://Acme/Laser"}) {
        const auto context = makeAutoSelectContext(uri, log);
        EXPECT_NE(context->autoSelectPPD(), 0) << uri;
        EXPECT_EQ(context->autoSelectGetInfo().product, std::nullopt) << uri;
        context->autoSelectSetIsBinaryOK(true);
        EXPECT_TRUE(context->autoSelectGetInfo().isBinaryOK) << uri;
    }
}

TEST(IppOptionSelection, KeepsAHostilePrintersTextsOutOfThePpd) {
    const std::string evil = "\"\n*cupsFilter: \"application/pdf 0 evil\"\n*%";
    const ScriptedPrinter printer(
        {.rawAttributes = {{IPP_TAG_TEXT, "printer-make-and-model", "Acme" + evil},
                           {IPP_TAG_NAME, "media-source-supported", evil},
                           {IPP_TAG_URI, "printer-strings-uri", "http://evil.example/"}}});
    const auto selection = select(printer.uri());
    EXPECT_EQ(selection.status, 0);
    EXPECT_TRUE(isSafe(selection.ppd));
    EXPECT_NE(selection.ppd, "");
    EXPECT_THAT(selection.ppd, Not(HasSubstr("\n*cupsFilter:")));
    EXPECT_THAT(selection.ppd, Not(HasSubstr("evil.example")));
}

TEST(IppOptionSelection, GivesUpOnASilentPrinterInTime) {
    // One exchange lasts 30 s at most; they all wait side by side.
    constexpr std::pair<const char*, Fault> kCases[] = {
        {"ipp", Fault::silent},          {"ipp", Fault::drip},
        {"ipp", Fault::halfThenSilence}, {"ipp", Fault::garbageThenSilence},
        {"ipps", Fault::silent},
    };
    std::vector<std::jthread> threads;
    for (const auto& [scheme, fault] : kCases)
        threads.emplace_back([scheme = scheme, fault = fault] {
            const ScriptedPrinter printer({.fault = fault});
            const auto start = std::chrono::steady_clock::now();
            const auto selection = select(printer.uri(scheme));
            EXPECT_EQ(selection.status, 0);
            EXPECT_EQ(selection.ppd, "");
            EXPECT_EQ(selection.log.size(), 1U);
            EXPECT_LT(std::chrono::steady_clock::now() - start, 35s) << scheme << static_cast<int>(fault);
        });
}

TEST(IppOptionSelection, GivesUpOnAPrinterThatIsSwitchedOff) {
    const BlackHole hole;
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(select("ipp://127.0.0.1:" + std::to_string(hole.port()) + "/ipp/print").ppd, "");
    EXPECT_LT(std::chrono::steady_clock::now() - start, 12s);
}

TEST(IppOptionSelection, WorksForManyPrintersSideBySide) {
    const ScriptedPrinter printer;
    std::vector<std::jthread> threads;
    for (int i = 0; i < 32; ++i)
        threads.emplace_back([&printer] {
            EXPECT_EQ(choices(select(printer.uri()).ppd, "PageSize"),
                      (std::set<std::string>{"A4", "Letter"}));
        });
}

}  // namespace
}  // namespace ventras
