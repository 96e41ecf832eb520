#include <sys/stat.h>

#include <filesystem>

#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/UsbBench.h"

// What somebody else may have laid where the agent works. Links in place of its guard file, and of a fax
// driver, are tested with the creation of queues.

namespace ventras {
namespace {

namespace fs = std::filesystem;

class HostileTemporaryFolder : public HostileRun {
protected:
    AgentRun runIn(const fs::path& folder) {
        auto environment = scheduler_.environment();
        environment["HOME"] = place_.path();
        environment["XDG_CONFIG_HOME"] = place_ / "config";
        environment["DBUS_SYSTEM_BUS_ADDRESS"] = "unix:path=" + (place_ / "no-bus").string();
        environment["TMPDIR"] = folder;
        const ProgramOptions options{
            .environment = std::move(environment), .user = scheduler_.user(), .errorsGoToJournal = true};
        return {runProgram({VENTRAS_AGENT, printer_.uri()}, options, std::chrono::seconds(40))};
    }

    fs::path made(std::string_view name) const {
        fs::create_directories(place_ / name);
        return place_ / name;
    }

    TemporaryFolder place_;
    ScriptedPrinter printer_{{.name = "Victim"}};
    Agent agent_{scheduler_};  // for what it leaves behind
};

// A "%41" or a "?" must not turn one path into another on the way through a URL.
TEST_F(HostileTemporaryFolder, MayHaveAnyName) {
    for (const auto* name : {"a b", "%41", "100%", "a#b", "a?b", "\"quoted\"", "-rf", "x;y", "caf\xc3\xa9",
                             "new\nline", "*", "$(reboot)", "a\\b"}) {
        const auto folder = made(name);
        const auto run = runIn(folder);
        EXPECT_EQ(run.exitStatus, 0) << name << '\n' << run.story();
        EXPECT_EQ(newQueues(), Names{"Victim"}) << name;
        EXPECT_TRUE(fs::is_empty(folder)) << name;
        expectHarmless(agent_, run);
        scheduler_.deleteQueue("Victim");
    }
}

TEST_F(HostileTemporaryFolder, ThatIsNoneEndsTheRunOneWayOrTheOther) {
    const auto pipe = place_ / "pipe";
    ASSERT_EQ(mkfifo(pipe.c_str(), 0666), 0);
    fs::create_symlink("loop", place_ / "loop");
    for (const auto& folder : {place_ / "none", place_.write("file", ""), fs::path(pipe), place_ / "loop",
                               fs::path(""), fs::path(std::string(5000, 'x'))}) {
        const auto run = runIn(folder);
        const bool isMade = newQueues() == Names{"Victim"};
        EXPECT_EQ(run.queueIDs(), newQueues()) << folder << '\n' << run.story();
        EXPECT_NE(isMade, run.standardError.find(printer_.uri()) != std::string::npos) << folder << '\n'
                                                                                       << run.story();
        expectHarmless(agent_, run);
        if (isMade)
            scheduler_.deleteQueue("Victim");
    }
    EXPECT_TRUE(fs::is_fifo(pipe));
    EXPECT_TRUE(fs::is_empty(place_ / "file"));
}

TEST_F(HostileTemporaryFolder, MayBeALinkToAnother) {
    const auto folder = made("real");
    fs::create_directory_symlink(folder, place_ / "link");
    const auto run = runIn(place_ / "link");
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(newQueues(), Names{"Victim"});
    EXPECT_TRUE(fs::is_empty(folder));
}

// Whoever lays something in the guard's place keeps that device from being set up, and gains nothing else.
class HostileGuard : public HostileRun {
protected:
    static constexpr const char* kGuard = "/tmp/usb:..Acme.Laser.serial=hostile-guard";

    ~HostileGuard() override { fs::remove_all(kGuard); }

    Environment environment() const {
        auto all = scheduler_.environment();
        all.merge(bench_.environment());
        return all;
    }

    void expectLeftAlone(const char* what) {
        const auto run = agent_.run({"-u20971520,0"});
        EXPECT_EQ(run.exitStatus, 0) << what << run.story();
        EXPECT_EQ(newQueues(), Names{}) << what;
        EXPECT_TRUE(fs::exists(fs::symlink_status(kGuard))) << what;
        expectHarmless(agent_, run);
        fs::remove_all(kGuard);
    }

    HostileGuard() : HostileRun({.models = {{}}}) {}

    TemporaryFolder place_;
    UsbBench bench_;
    Agent agent_{environment(), std::nullopt};
};

TEST_F(HostileGuard, IsNeitherFollowedNorWrittenNorWaitedFor) {
    installDriver();
    FakePrinterModel model;
    model.deviceID = "MFG:Acme;MDL:Laser;CMD:PCL;SN:hostile-guard;";
    bench_.plugIn("1-4", std::move(model));
    const auto victim = place_.write("victim", "precious");

    fs::create_symlink(victim, kGuard);
    expectLeftAlone("a link to a file");
    fs::create_symlink(place_ / "new", kGuard);
    expectLeftAlone("a link to nothing");
    ASSERT_EQ(mkfifo(kGuard, 0666), 0);
    expectLeftAlone("a pipe");
    fs::create_directory(kGuard);
    expectLeftAlone("a folder");

    EXPECT_EQ(readFile(victim), "precious");
    EXPECT_FALSE(fs::exists(place_ / "new"));
}

// A scanner's module and icon are paths that nobody opens: the queue's PPD names them to programs of the
// desktop.
TEST_F(HostileRun, ScannersModulesAndIconsAreTextsOnly) {
    const TemporaryFolder place;
    const auto pipe = (place / "pipe").string();
    ASSERT_EQ(mkfifo(pipe.c_str(), 0666), 0);
    fs::create_symlink("/etc/passwd", place / "link");
    const Agent agent(scheduler_);
    for (const auto& path :
         {std::string("../../../../etc/passwd"), std::string("/dev/zero"), pipe, (place / "link").string(),
          std::string("file:///etc/passwd"), std::string(200, '/')}) {
        const auto run = agent.run({"--scannerU,P,Flatbed," + path + ",USB,1,2,3," + path});
        EXPECT_EQ(run.exitStatus, 0) << path << '\n' << run.story();
        EXPECT_LT(run.wallTime, std::chrono::seconds(5)) << path;
        const auto ppd = scheduler_.ppd("Flatbed");
        EXPECT_THAT(ppd, testing::HasSubstr("*QLScannerModulePath: \"" + path + "\"\n"));
        EXPECT_THAT(ppd, testing::HasSubstr("*QLPrinterIconPath: \"" + path + "\"\n"));
        expectHarmless(agent, run);
        scheduler_.deleteQueue("Flatbed");
    }
}

}  // namespace
}  // namespace ventras
