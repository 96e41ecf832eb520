#include "platform/linux/options/UsbOptionSelection.h"

#include <gmock/gmock.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <string>
#include <thread>

#include "tests/fakes/FakePlatform.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/PostScriptInterpreter.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"
#include "tests/usb/PostScriptModel.h"
#include "tests/usb/PostScriptPpd.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::Optional;

constexpr const char* kPrologue =
    "/statusdict 10 dict def statusdict /product (Example PS 9000) put /duplexerInstalled true def /trays 2 "
    "def";

class UsbAutoSelect : public testing::Test {
protected:
    FakePrinter& attach(FakePrinterModel model = postScriptModel(), const std::string& place = "1-4") {
        auto& printer = bench.plugIn(place, std::move(model));
        bench.node(place).bindDriver(0, "usblp");
        printer.interpreter = PostScriptInterpreter(kPrologue);
        return printer;
    }

    std::optional<std::string> product(const std::string& uri = kPostScriptURI) {
        UsbOptionSelection selection(uri, fakes.log);
        status = selection.autoSelectPPD();
        return selection.autoSelectGetInfo().product;
    }

    /// The text of the new PPD, empty when there is none.
    std::string newPpd(const std::string& uri = kPostScriptURI) {
        UsbOptionSelection selection(uri, fakes.log);
        status = selection.autoSelectInstallableOptions(folder.write("driver.ppd", postScriptPpd()));
        const auto url = selection.autoSelectHasNewPPD();
        if (!url)
            return "";
        EXPECT_EQ(selection.autoSelectHasNewPPD(), url) << "asking twice must give the same";
        const auto path = url->substr("file://"s.size());
        const auto text = readFile(path);
        std::filesystem::remove(path);
        return text;
    }

    /// Whether everything was given back: no claim, no open node, the kernel's driver in its place.
    void expectGivenBack(const std::string& place = "1-4", const std::string& driver = "usblp") {
        auto& node = bench.node(place);
        comesTrue([&] { return node.openAtPresent() == 0; }, 5s);
        EXPECT_EQ(node.openAtPresent(), 0);
        EXPECT_FALSE(node.isClaimed(0));
        EXPECT_EQ(node.driver(0), driver);
    }

    UsbBench bench;
    FakePlatform fakes;
    TemporaryFolder folder;
    std::int32_t status = -1;
};

// Product -----------------------------------------------------------------------------------------

TEST_F(UsbAutoSelect, AsksThePostScriptInterpreterForItsProduct) {
    attach();
    EXPECT_THAT(product(), Optional("(Example PS 9000)"s));
    EXPECT_EQ(status, 0);
    expectGivenBack();
}

TEST_F(UsbAutoSelect, FindsTheProductInSystemdictToo) {
    attach().interpreter = PostScriptInterpreter("");
    EXPECT_THAT(product(), Optional("(GPL Ghostscript)"s));
}

TEST_F(UsbAutoSelect, EntersPostScriptByPjlWhereThePrinterHasIt) {
    auto model = postScriptModel();
    model.deviceID = "MFG:Example;MDL:PS 9000;CMD:PJL,PCL,POSTSCRIPT;SN:A1;";
    auto& printer = attach(model);
    printer.interpreter = PostScriptInterpreter(kPrologue, true);
    EXPECT_THAT(product(), Optional("(Example PS 9000)"s));
    EXPECT_THAT(printer.received(), HasSubstr("\x1b%-12345X@PJL ENTER LANGUAGE=POSTSCRIPT"));
}

TEST_F(UsbAutoSelect, SendsNoPjlToAPrinterWithoutIt) {
    auto& printer = attach();
    EXPECT_TRUE(product());
    EXPECT_THAT(printer.received(), Not(HasSubstr("@PJL")));
}

TEST_F(UsbAutoSelect, TellsWhetherTheChannelTakesBinaryData) {
    for (const auto& [protocol, isBinary] : {std::pair{"/Raw", true}, std::pair{"/Binary", true},
                                             std::pair{"/Normal", false}, std::pair{"/TBCP", false}}) {
        auto& printer = attach();
        printer.interpreter = PostScriptInterpreter(
            kPrologue + " /currentdevparams {pop 1 dict dup /Protocol "s + protocol + " put} def");
        UsbOptionSelection selection(kPostScriptURI, fakes.log);
        EXPECT_EQ(selection.autoSelectPPD(), 0);
        EXPECT_EQ(selection.autoSelectGetInfo().isBinaryOK, isBinary) << protocol;
        bench.unplug("1-4");
    }
}

TEST_F(UsbAutoSelect, TakesAnAnswerWithoutAnEndOnceThePrinterIsQuiet) {
    attach().interpreter = [](std::string_view data) {
        return data.find("product ==") == data.npos ? ""s : "(Example)\r\n"s;
    };
    EXPECT_THAT(product(), Optional("(Example)"s));
}

TEST_F(UsbAutoSelect, LeavesOutWhatThePrinterSaidBefore) {
    auto said = std::make_shared<std::string>("(Something else)\n");
    attach().interpreter = [=, gs = PostScriptInterpreter(kPrologue)](std::string_view data) mutable {
        return std::exchange(*said, "") + gs(data);
    };
    EXPECT_THAT(product(), Optional("(Example PS 9000)"s));
}

TEST_F(UsbAutoSelect, HasNoProductWhenTheInterpreterTellsNone) {
    for (const auto* prologue : {"/statusdict 10 dict def statusdict /product () put",
                                 "/statusdict 10 dict def statusdict /product (a\\012b) put",
                                 "/statusdict 10 dict def statusdict /product 17 put"}) {
        attach().interpreter = PostScriptInterpreter(prologue);
        EXPECT_EQ(product(), std::nullopt) << prologue;
        EXPECT_EQ(status, 0) << prologue;
        bench.unplug("1-4");
    }
}

// Which printer -----------------------------------------------------------------------------------

TEST_F(UsbAutoSelect, FindsThePrinterByItsLocation) {
    attach({.deviceID = "MFG:Example;MDL:PS 9000;CMD:POSTSCRIPT;"}, "2-1.3");
    EXPECT_TRUE(product("usb://Example/PS%209000?location=2130000"));
    EXPECT_FALSE(product("usb://Example/PS%209000?location=2140000"));
    EXPECT_NE(status, 0);
}

TEST_F(UsbAutoSelect, FindsThePrinterByTheSerialNumberOfItsDescriptor) {
    attach({.deviceID = "CMD:POSTSCRIPT;", .serialNumber = "A+1"});
    EXPECT_TRUE(product("usb://Example/PS%209000?serial=A1"));
}

TEST_F(UsbAutoSelect, ReadsTheDeviceIDAsItWasReadForTheURI) {
    for (const auto* deviceID : {"MFG:Example;MDL:PS 9000;CMD:POSTSCRIPT; SN:A1;",
                                 "MFG:Example;MDL:PS 9000; cmd:PostScript;\tsern:A1;",
                                 "MFG:Example;MDL:PS 9000;command set:PS;srn:A1"}) {
        attach({.deviceID = deviceID, .serialNumber = "on the bus"});
        EXPECT_TRUE(product()) << deviceID << ": " << testing::PrintToString(fakes.log.lines());
        bench.unplug("1-4");
    }
}

TEST_F(UsbAutoSelect, AsksOneOfSeveralPrinters) {
    auto other = postScriptModel();
    other.deviceID = "MFG:Example;MDL:PS 9000;CMD:POSTSCRIPT;SN:B2;";
    auto& untouched = attach(other, "1-1");
    attach();
    EXPECT_TRUE(product());
    EXPECT_THAT(untouched.received(), IsEmpty());
}

TEST_F(UsbAutoSelect, TellsPrintersOfOneSerialNumberApartByTheirModel) {
    auto other = postScriptModel();
    other.deviceID = "MFG:Example;MDL:PS 100;CMD:POSTSCRIPT;SN:A1;";
    auto& untouched = attach(other, "1-1");
    attach();
    EXPECT_TRUE(product());
    EXPECT_THAT(untouched.received(), IsEmpty());
}

TEST_F(UsbAutoSelect, AsksNobodyWhenSeveralPrintersCouldBeMeant) {
    auto& one = attach();
    auto& two = attach(postScriptModel(), "1-5");
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_NE(status, 0);
    EXPECT_THAT(one.received() + two.received(), IsEmpty());
    EXPECT_THAT(fakes.log.lines().at(0), HasSubstr("several printers"));
}

TEST_F(UsbAutoSelect, AsksNobodyForAUriWithoutADevice) {
    attach();
    for (const auto* uri : {"usb://Example/PS%209000", "usb://Example/PS%209000?serial=", "usb:", "usb://",
                            "usb://Example/PS%209000?location=", "usb://Example/PS%209000?location=xyz",
                            "ipp://Example/PS%209000?serial=A1", "", "usb://Example/PS%209000?serial=A2"})
        EXPECT_TRUE(!product(uri) && status != 0) << uri;
    EXPECT_EQ(bench.node("1-4").driver(0), "usblp");
}

// Printers that are not to be asked ---------------------------------------------------------------

TEST_F(UsbAutoSelect, SendsNothingToAPrinterThatSpeaksNoPostScript) {
    for (const auto* commandSet : {"CMD:PCL,PJL;", "", "CMD:;", "CMD:PSX;", "COMMAND SET:EPS;"}) {
        auto& printer = attach({.deviceID = "MFG:Example;MDL:PS 9000;SN:A1;"s + commandSet});
        EXPECT_EQ(product(), std::nullopt) << commandSet;
        EXPECT_THAT(newPpd(), IsEmpty()) << commandSet;
        EXPECT_THAT(printer.received(), IsEmpty()) << commandSet;
        bench.unplug("1-4");
    }
}

TEST_F(UsbAutoSelect, KnowsPostScriptByItsNames) {
    for (const auto* commandSet : {"CMD:PostScript Level 3;", "cmd:PCL, PS;", "COMMAND SET:ps;"}) {
        attach({.deviceID = "MFG:Example;MDL:PS 9000;SN:A1;"s + commandSet});
        EXPECT_TRUE(product()) << commandSet;
        bench.unplug("1-4");
    }
}

TEST_F(UsbAutoSelect, LeavesAOneWayPrinterAlone) {
    auto model = postScriptModel();
    model.settings = {{0, 0, 7, 1, 1}};
    auto& printer = attach(model);
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_THAT(printer.received(), IsEmpty());
}

TEST_F(UsbAutoSelect, TalksThroughTheBidirectionalSettingAndPutsTheFormerOneBack) {
    auto model = postScriptModel();
    model.settings = {{0, 0, 7, 1, 1}, {0, 1, 7, 1, 2}};
    auto& printer = attach(model);
    EXPECT_TRUE(product());
    EXPECT_EQ(printer.currentSetting(0), 0);
    std::vector<int> settings;
    for (const auto& request : printer.requests())
        if (request.bmRequestType == 0x01 && request.bRequest == 11)
            settings.push_back(request.wValue);
    EXPECT_THAT(settings, testing::ElementsAre(1, 0));
    expectGivenBack();
}

// Options -----------------------------------------------------------------------------------------

TEST_F(UsbAutoSelect, WritesWhatIsInstalledIntoANewPpd) {
    attach();
    const auto text = newPpd();
    EXPECT_EQ(status, 0);
    EXPECT_THAT(text, HasSubstr("*DefaultDuplexer: True\n"));
    EXPECT_THAT(text, HasSubstr("*DefaultTrays: Two\n"));
    EXPECT_THAT(text, HasSubstr("*DefaultStapler: False\n"));
    EXPECT_EQ(text.size(), postScriptPpd().size() - 2);  // "False" and "None" became "True" and "Two"
    expectGivenBack();
}

TEST_F(UsbAutoSelect, MakesNoNewPpdWhenTheDriverIsRightAlready) {
    attach().interpreter = PostScriptInterpreter("/duplexerInstalled false def /trays 0 def");
    EXPECT_THAT(newPpd(), IsEmpty());
    EXPECT_EQ(status, 0);
}

TEST_F(UsbAutoSelect, GoesOnWithTheOtherOptionsAfterAProgramThatFails) {
    attach().interpreter = PostScriptInterpreter("/trays 1 def");  // no duplexerInstalled
    const auto text = newPpd();
    EXPECT_THAT(text, HasSubstr("*DefaultDuplexer: False\n"));
    EXPECT_THAT(text, HasSubstr("*DefaultTrays: One\n"));
}

TEST_F(UsbAutoSelect, AsksNothingForAPpdWithoutQueries) {
    auto& printer = attach();
    auto text = postScriptPpd();
    text.erase(text.find("*OpenGroup"));
    UsbOptionSelection selection(kPostScriptURI, fakes.log);
    EXPECT_EQ(selection.autoSelectInstallableOptions(folder.write("plain.ppd", text)), 0);
    EXPECT_EQ(selection.autoSelectHasNewPPD(), std::nullopt);
    EXPECT_EQ(bench.node("1-4").timesOpened(), 0);
    EXPECT_THAT(printer.received(), IsEmpty());
}

TEST_F(UsbAutoSelect, FailsForAPpdThatIsNone) {
    attach();
    UsbOptionSelection selection(kPostScriptURI, fakes.log);
    EXPECT_NE(selection.autoSelectInstallableOptions(folder.write("bad.ppd", "no PPD")), 0);
    EXPECT_NE(selection.autoSelectInstallableOptions(folder / "absent.ppd"), 0);
}

TEST_F(UsbAutoSelect, DeletesANewPpdThatNobodyTakes) {
    attach();
    setenv("TMPDIR", folder.path().c_str(), 1);
    {
        UsbOptionSelection selection(kPostScriptURI, fakes.log);
        EXPECT_EQ(selection.autoSelectInstallableOptions(folder.write("driver.ppd", postScriptPpd())), 0);
    }
    unsetenv("TMPDIR");
    for (const auto& entry : std::filesystem::directory_iterator(folder.path()))
        EXPECT_EQ(entry.path().filename(), "driver.ppd");
}

// Faults ------------------------------------------------------------------------------------------

TEST_F(UsbAutoSelect, GivesUpOnASilentPrinter) {
    attach().interpreter = nullptr;
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_EQ(status, 0);
    EXPECT_LT(std::chrono::steady_clock::now() - start, UsbOptionSelection::kAnswerLimit + 5s);
    EXPECT_THAT(fakes.log.lines().at(0), HasSubstr("no answer in time"));
    expectGivenBack();
}

TEST_F(UsbAutoSelect, GivesUpWhenTheChannelBreaks) {
    for (const int error : {EPIPE, EPROTO, ESHUTDOWN, EOVERFLOW}) {
        attach().bulkFault = [=](std::uint8_t) { return std::optional{UsbAnswer{error, {}, {}}}; };
        EXPECT_EQ(product(), std::nullopt) << error;
        EXPECT_THAT(newPpd(), IsEmpty()) << error;
        expectGivenBack();
        bench.unplug("1-4");
    }
}

TEST_F(UsbAutoSelect, BoundsAPrinterThatTalksWithoutEnd) {
    attach().interpreter = [](std::string_view) { return std::string(4096, 'x'); };
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_LT(std::chrono::steady_clock::now() - start, UsbOptionSelection::kAnswerLimit + 5s);
    expectGivenBack();
}

TEST_F(UsbAutoSelect, LeavesAPrinterThatSomebodyElseUses) {
    auto& printer = attach();
    LibusbContext context;
    int error = 0;
    const auto other = context.devices()->at(1)->open(error);
    ASSERT_TRUE(other) << error;
    ASSERT_EQ(libusb_set_auto_detach_kernel_driver(other.get(), 1), 0);
    ASSERT_EQ(libusb_claim_interface(other.get(), 0), 0);
    EXPECT_EQ(product(), std::nullopt);
    EXPECT_NE(status, 0);
    EXPECT_THAT(printer.received(), IsEmpty());
    EXPECT_THAT(fakes.log.lines().at(0), HasSubstr("in use"));
}

TEST_F(UsbAutoSelect, LeavesNothingBehindWhenThePrinterIsUnpluggedMeanwhile) {
    attach().interpreter = nullptr;
    std::thread unplugger([&] {
        std::this_thread::sleep_for(300ms);
        bench.node("1-4").unplug();
    });
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(product(), std::nullopt);
    unplugger.join();
    EXPECT_LT(std::chrono::steady_clock::now() - start, 5s);
}

TEST_F(UsbAutoSelect, GivesThePrinterBackWhenTheProcessIsToldToEnd) {
    attach().interpreter = nullptr;
    auto& node = bench.node("1-4");
    // The program asks on and on; it is another process so that it may die of the signal.
    const pid_t child = fork();
    if (child == 0) {
        execl("/proc/self/exe", "ventras-usb-test", "--ask-product", kPostScriptURI, nullptr);
        _exit(127);
    }
    ASSERT_TRUE(comesTrue([&] { return node.isClaimed(0); }, 20s)) << "the other process never began";
    const auto told = std::chrono::steady_clock::now();
    kill(child, SIGTERM);
    int result = 0;
    waitpid(child, &result, 0);
    EXPECT_TRUE(WIFSIGNALED(result) && WTERMSIG(result) == SIGTERM) << result;
    EXPECT_LT(std::chrono::steady_clock::now() - told, 3s);
    expectGivenBack();
}

}  // namespace
}  // namespace ventras
