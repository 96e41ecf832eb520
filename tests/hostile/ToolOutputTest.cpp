#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"

// ventrasctl shows people what devices say. Nothing of it is an order to their terminal.

namespace ventras {
namespace {

const std::string kEscapes =
    "\x1b]0;owned\x07\x1b[2J\x1b[31mred\x08\x7f\xc2\x9b"
    "31m\r\n\x01";

class ToolOutput : public HostileRun {
protected:
    ProgramResult tool(Names arguments, const std::string& input = {}) const {
        arguments.insert(arguments.begin(), VENTRAS_TOOL);
        return runProgram(arguments, {.environment = scheduler_.environment(), .standardInput = input});
    }

    void expectPlain(const Names& arguments, const std::string& input = {}) const {
        const auto run = tool(arguments, input);
        const auto what = testing::PrintToString(arguments);
        EXPECT_EQ(run.signal, 0) << what;
        EXPECT_TRUE(isPlain(run.standardOutput)) << what << testing::PrintToString(run.standardOutput);
        EXPECT_TRUE(isPlain(run.standardError)) << what << testing::PrintToString(run.standardError);
    }

    /// For people, and for programs.
    void expectBothPlain(Names arguments) const {
        expectPlain(arguments);
        arguments.emplace_back("--json");
        expectPlain(arguments);
    }

    /// A queue whose texts and driver hold what they should not, as its owner may make it.
    void addHostileQueue() const {
        scheduler_.addQueue(
            "Hostile", "ipp://127.0.0.1/%1b[31m",
            readFile(testDocument("colour-duplex.ppd")) + "*Product: \"(" + kEscapes + ")\"\n");
    }
};

TEST_F(ToolOutput, AboutTextsIsPlain) {
    expectBothPlain({"device-id", "MFG:Acme" + kEscapes + ";MDL:Laser" + kEscapes + ";SN:" + kEscapes + ";"});
    expectBothPlain({"txt", "usb_MFG=" + kEscapes, "usb_MDL=" + kEscapes});
    expectBothPlain({"name", kEscapes});
    expectBothPlain({"predicate", "MFG:" + kEscapes + ";MDL:" + kEscapes});
    expectBothPlain({"match", "--device-id", "MFG:" + kEscapes + ";MDL:" + kEscapes, "--model", kEscapes});
    expectBothPlain({"scanner", "U" + kEscapes + ",P,N" + kEscapes + ",/i,USB,1,2,3"});
    expectBothPlain({"explain", "--scannerU" + kEscapes + ",P,N" + kEscapes + ",/i,USB,1,2,3"});
    expectBothPlain({"explain", "ipp://127.0.0.1:1/" + kEscapes});
}

TEST_F(ToolOutput, AboutPrintersIsPlain) {
    for (const auto* attribute :
         {"printer-dns-sd-name", "printer-make-and-model", "printer-location", "urf-supported"}) {
        const ScriptedPrinter printer({.rawAttributes = {{IPP_TAG_NAME, attribute, kEscapes}}});
        expectBothPlain({"printer", printer.uri()});
        expectBothPlain({"explain", printer.uri()});
    }
}

TEST_F(ToolOutput, AboutQueuesAndFilesIsPlain) {
    addHostileQueue();
    expectBothPlain({"queues"});
    const TemporaryFolder folder;
    const auto file = folder.write("a.ppd", scheduler_.ppd("Hostile"));
    expectBothPlain({"ppd", file});
    expectBothPlain({"ppd", folder.path().string() + "/" + kEscapes});
}

TEST_F(ToolOutput, AboutWrongUsageIsPlain) {
    expectPlain({kEscapes});
    expectPlain({"match", "--catalogue", kEscapes});
    expectPlain({"kind"}, kEscapes);
    expectPlain({"match", "-", "--catalogue", "/dev/null"}, kEscapes);
    expectPlain({"catalogue", "lookup", kEscapes});
}

}  // namespace
}  // namespace ventras
