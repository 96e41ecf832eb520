#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <string>
#include <thread>

#include "tests/agent/Agent.h"
#include "tests/catalogue/CatalogueTexts.h"
#include "tests/install/RealPackageKit.h"
#include "tests/install/ScriptedNotifications.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/UsbBench.h"
#include "tests/platform-linux/PostedNotifications.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char* kPrinterHere = "-u20971520,0";   // 1-4
constexpr const char* kPrinterThere = "-u22020096,0";  // 1-5
constexpr const char* kPackage = "printer-driver-brlaser";
constexpr const char* kBrother = "MFG:Brother;CMD:PJL,HBP;MDL:DCP-7030;CLS:PRINTER;SN:B7;";
constexpr const char* kStranger = "MFG:Acme;MDL:Winjet;CMD:GDI;CLS:PRINTER;SN:W1;";

/// The package of this machine's Brother driver, built anew from what is installed of it.
TestPackage brotherDriver() {
    return {.name = kPackage,
            .version = "6-3",
            .files = {{"usr/share/cups/drv/brlaser.drv", readFile("/usr/share/cups/drv/brlaser.drv")}}};
}

// The whole program with a real scheduler that has no drivers, real package management, the catalogue's real
// service, an emulated USB, and a user at the buttons of a notification.
class AgentInstall : public testing::Test {
protected:
    AgentInstall() {
        // The package manager installs into the data folder of the scheduler.
        fs::create_directories(root_.path() / "usr/share");
        fs::create_directory_symlink(scheduler_.folder() / "data", root_.path() / "usr/share/cups");
        fs::create_directories(scheduler_.folder() / "data/drv");
        root_.afterChanges(std::string("sh ") + VENTRAS_REGISTER_DRIVERS + " " +
                           (root_.path() / "usr/share/cups").string() + " " +
                           (root_.path() / "usr/share/ppd").string());
        for (const auto& entry : fs::directory_iterator(VENTRAS_SOURCE_DATA))
            fs::create_symlink(entry.path(), data_ / entry.path().filename().string());
        packageKit_.emplace(root_);
        catalogue_ = std::make_unique<RunningProgram>(std::vector<std::string>{VENTRAS_TEST_CATALOGUE_AGENT},
                                                      ProgramOptions{.environment = environment()});
        waitForService("com.quillon.lorvextool.agent", *catalogue_);
    }

    Environment environment() const {
        return together({{{"VENTRAS_DATA_DIR", data_.path()}, {"DISPLAY", ""}, {"WAYLAND_DISPLAY", ""}},
                         bus_.environment(),
                         bench_.environment(),
                         scheduler_.environment()});
    }

    void attach(const std::string& deviceID, const std::string& place = "1-4") {
        FakePrinterModel model;
        model.deviceID = deviceID;
        bench_.plugIn(place, model);
        bench_.node(place).bindDriver(0, "usblp");
    }

    AgentRun run(const std::vector<std::string>& arguments, const Environment& more = {}) const {
        return Agent(together({more, environment()}), std::nullopt).run(arguments);
    }

    TemporaryFolder data_;
    UsbBench bench_;
    PrivateBus bus_;
    PrivateScheduler scheduler_{{.models = {{}}}};
    PackageRoot root_{TestPackages{brotherDriver()}};
    std::optional<RealPackageKit> packageKit_;
    std::unique_ptr<RunningProgram> catalogue_;
};

TEST_F(AgentInstall, AfterAYesMakesTheQueueWithTheDriverOfThePackage) {
    attach(kBrother);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    const auto run = this->run({kPrinterHere});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(root_.stateOf(kPackage), "ii ");
    ASSERT_EQ(scheduler_.queues(), std::vector<std::string>{run.queueID()}) << run.story();
    EXPECT_EQ(scheduler_.attribute(run.queueID(), "device-uri"), "usb://Brother/DCP-7030?serial=B7");
    EXPECT_THAT(scheduler_.ppd(run.queueID()), HasSubstr("rastertobrlaser"));

    int questions = 0;
    for (const auto& notification : desktop.shown())
        questions += notification.buttons.empty() ? 0 : 1;
    EXPECT_EQ(questions, 1);
    const auto question = desktop.shown().at(0);
    EXPECT_EQ(question.title, "Would you like to download and install software for 'Brother DCP-7030'?");
    EXPECT_THAT(question.body, HasSubstr("(printer-driver-brlaser 6-3)\nBrother DCP-7030"));
}

TEST_F(AgentInstall, AfterANoInstallsNothing) {
    attach(kBrother);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("cancel"));
    const auto run = this->run({kPrinterHere});
    EXPECT_EQ(run.exitStatus, 128) << run.story();
    EXPECT_EQ(root_.stateOf(kPackage), "");
    EXPECT_THAT(scheduler_.queues(), IsEmpty());
}

TEST_F(AgentInstall, WithNobodyToAskInstallsNothing) {
    attach(kBrother);
    const auto run = this->run({kPrinterHere});
    EXPECT_EQ(run.exitStatus, 128) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr("there is nobody to ask"));
    EXPECT_EQ(root_.stateOf(kPackage), "");
}

TEST_F(AgentInstall, AsksByAWindowWhereNotificationsHaveNoButtons) {
    attach(kBrother);
    ScriptedNotifications desktop({}, {"body"});
    const TemporaryFolder session;
    session.write("wayland-0", "");
    fs::permissions(session.write("bin/zenity", "#!/bin/sh\necho \"$1\" >> \"$XDG_RUNTIME_DIR/calls\"\n"),
                    fs::perms{0755});
    const auto run = this->run({kPrinterHere}, {{"XDG_RUNTIME_DIR", session.path()},
                                                {"WAYLAND_DISPLAY", "wayland-0"},
                                                {"PATH", (session / "bin").string() + ":/usr/bin:/bin"}});
    EXPECT_EQ(run.exitStatus, 0) << run.story();
    EXPECT_EQ(root_.stateOf(kPackage), "ii ");
    EXPECT_THAT(readFile(session / "calls"), testing::StartsWith("--question\n"));
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

TEST_F(AgentInstall, TakesTheReasonOfAFailedInstallForItsStatus) {
    attach(kBrother);
    ScriptedNotifications desktop([this](ScriptedNotifications& service, unsigned id) {
        root_.loseSource();
        service.press(id, "install");
    });
    const auto run = this->run({kPrinterHere});
    EXPECT_GT(run.exitStatus, 1) << run.story();
    EXPECT_LT(run.exitStatus, 111) << run.story();
    EXPECT_THAT(run.standardError, HasSubstr("no driver package is installed for")) << run.story();
    EXPECT_EQ(root_.stateOf(kPackage), "");
}

TEST_F(AgentInstall, AsksNobodyWithoutPackageKit) {
    packageKit_.reset();
    attach(kBrother);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    const auto run = this->run({kPrinterHere});
    EXPECT_EQ(run.exitStatus, 106) << run.story();
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

TEST_F(AgentInstall, OffersNothingWhereTwoPackagesFit) {
    fs::remove(data_ / "driver-packages.plist");
    const std::vector<std::string> tags{"MANUFACTURER:Acme;MODEL:Winjet"};
    data_.write("driver-packages.plist",
                textOf(catalogueContent({{"one", packageEntry(0, tags)}, {"two", packageEntry(0, tags)}})));
    attach(kStranger);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    const auto run = this->run({kPrinterHere});
    EXPECT_EQ(run.exitStatus, 1) << run.story();
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

TEST_F(AgentInstall, OffersNothingWhereNoPackageFits) {
    attach(kStranger);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    EXPECT_EQ(run({kPrinterHere}).exitStatus, 1);
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

TEST_F(AgentInstall, OffersNothingWithoutTheCataloguesService) {
    catalogue_->end();
    attach(kBrother);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    EXPECT_EQ(run({kPrinterHere}).exitStatus, 1);
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

TEST_F(AgentInstall, InSkerrowModeTellsOfEachUsbPrinterInstead) {
    attach(kBrother);
    attach(kStranger, "1-5");
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    PostedNotifications posted;
    const auto run = this->run({kPrinterHere, kPrinterThere, "--skerrow"});
    EXPECT_EQ(run.exitStatus, 1) << run.story();
    EXPECT_THAT(posted.heard(2),
                testing::UnorderedElementsAre(AllOf(HasSubstr("DCP-7030"), HasSubstr("'Match': <int64 1>")),
                                              AllOf(HasSubstr("Winjet"), HasSubstr("'Match': <int64 0>"))));
    EXPECT_THAT(desktop.shown(), IsEmpty());
    EXPECT_EQ(root_.stateOf(kPackage), "");
}

TEST_F(AgentInstall, IsNotOfferedWithDownloadsTurnedOff) {
    attach(kBrother);
    ScriptedNotifications desktop(ScriptedNotifications::pressing("install"));
    EXPECT_EQ(run({kPrinterHere, "--download"}).exitStatus, 241);
    EXPECT_THAT(desktop.shown(), IsEmpty());
}

}  // namespace
}  // namespace ventras
