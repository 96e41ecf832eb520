#include <algorithm>
#include <filesystem>

#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"

// What a printer may call itself. Names that hold control characters, or no UTF-8, are tested with faulty
// printers.

namespace ventras {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

struct NameCase {
    const char* name;
    std::string text;
    std::string queue;
};

const std::string kRightToLeft = "\xe2\x80\xae";

const NameCase kNames[] = {
    {"an option", "-d", "-d"},
    {"a long option", "--help", "--help"},
    {"the folder itself", ".", "."},
    {"the folder above", "..", ".."},
    {"a path", "/etc/passwd", "_etc_passwd"},
    {"a path to the folder above", "../../etc/cron.d/x", ".._.._etc_cron.d_x"},
    {"a comment", "#default", "_default"},
    {"blanks", "  a  b  ", "__a__b__"},
    {"a shell's words", "a;reboot|b&c`d`$(e)>f", "a;reboot|b&c`d`$(e)>f"},
    {"quotation marks", "'a' \"b\"", "'a'_\"b\""},
    {"a pattern", "*?[a]{b}", "*?[a]{b}"},
    {"percent signs", "%2e%2e%2f%00%n%s", "%2e%2e%2f%00%n%s"},
    {"a query", "a?b=c&d", "a?b=c&d"},
    {"a backslash", "a\\nb\\", "a\\nb\\"},
    {"an instance", "Office/draft", "Office_draft"},
    {"markup", "<script>alert(1)</script>", "<script>alert(1)<_script>"},
    {"text from right to left", "Office" + kRightToLeft + "fdp.exe", "Office" + kRightToLeft + "fdp.exe"},
    {"characters of four bytes", "\xf0\x9f\x96\xa8\xf0\x9f\x92\xa9", "\xf0\x9f\x96\xa8\xf0\x9f\x92\xa9"},
    {"somebody else's name", "Present", "Present_2"},
    {"somebody else's name in other letters", "pReSeNt", "pReSeNt_2"},
};

class PrinterNames : public HostileRun {
protected:
    /// Every file of the scheduler's folder that is no log, spool or cache.
    Names configurationFiles() const {
        Names files;
        for (const auto& entry : fs::recursive_directory_iterator(scheduler_.folder()))
            if (entry.path().extension() == ".ppd" || entry.path().extension() == ".conf")
                files.push_back(fs::relative(entry.path(), scheduler_.folder()));
        return files;
    }

    Agent agent_{scheduler_};
};

TEST_F(PrinterNames, GiveOneQueueEachAndTouchNoOther) {
    for (const auto& [name, text, expected] : kNames) {
        const ScriptedPrinter printer({.name = text});
        const auto run = agent_.run({printer.uri()});
        EXPECT_EQ(run.exitStatus, 0) << name << '\n' << run.story();
        EXPECT_EQ(run.queueIDs(), Names{expected}) << name;
        EXPECT_EQ(newQueues(), Names{expected}) << name;
        EXPECT_EQ(scheduler_.attribute(expected, "device-uri"), printer.uri()) << name;
        expectHarmless(agent_, run);
        const auto before = stateOfQueues(scheduler_, {expected});
        EXPECT_EQ(agent_.run({printer.uri()}).queueIDs(), Names{}) << name;
        EXPECT_EQ(stateOfQueues(scheduler_, {expected}), before) << name;
        scheduler_.deleteQueue(expected);
        EXPECT_EQ(newQueues(), Names{}) << name;
    }
}

TEST_F(PrinterNames, LeaveTheSchedulersFilesWhereTheyBelong) {
    const auto before = configurationFiles();
    for (const auto* name : {"..", ".", "../../evil", "/evil"}) {
        const ScriptedPrinter printer({.name = name});
        const auto queue = agent_.run({printer.uri()}).queueID();
        ASSERT_NE(queue, "") << name;
        for (const auto& file : configurationFiles())
            EXPECT_TRUE(std::ranges::count(before, file) != 0 ||
                        fs::path(file).parent_path().filename() == "ppd")
                << name << " made " << file;
        scheduler_.deleteQueue(queue);
    }
}

// A log that takes a text for a format would crash here, or print what is on the stack.
TEST_F(PrinterNames, AreNoFormatsForTheLog) {
    const std::string formats = "%n%n%n%s%s%s%x%99999999d%1$*2$d";
    const ScriptedPrinter printer({.name = formats, .fault = Fault::none});
    EXPECT_EQ(agent_.run({printer.uri()}).queueIDs(), Names{formats});

    const ScriptedPrinter nameless({.edit = [](ipp_t* answer) { removeAttribute(answer, "urf-supported"); }});
    const auto uri = nameless.uri() + "/" + formats;
    const auto run = agent_.run({uri});
    EXPECT_EQ(run.exitStatus, 255) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr(uri));
    expectHarmless(agent_, run);
}

TEST_F(PrinterNames, DoNotReachATerminalWithWhatItObeys) {
    const auto uri = "ipp://127.0.0.1:1/" + std::string("\x1b[31m\x07");
    const auto run = agent_.run({uri});
    EXPECT_EQ(run.exitStatus, 255) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr("\\x1B[31m\\x07"));
    expectHarmless(agent_, run);
}

}  // namespace
}  // namespace ventras
