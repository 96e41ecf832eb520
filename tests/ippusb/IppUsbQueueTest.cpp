#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <optional>

#include "devices/IPPUSBObject.h"
#include "drivers/PPDManager.h"
#include "platform/QueueAttributes.h"
#include "queues/QueueMaker.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PpdTexts.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

const DeviceDescription kLaser{{"usb_MFG", "Acme"}, {"usb_MDL", "Laser"}, {"usb_SN", "A1"}};
const std::string kUsbURI = "usb://Acme/Laser?serial=A1";
const std::string kIppUsbURI = "ippusb://Laser%20(USB)._ipp._tcp.local./";
const std::string kFaxEnding = "VellumFax.ppd";

const std::string kFaxPPD = ppdWith("*cupsFax: True\n");

DeviceDescription faxing(DeviceDescription txt) {
    txt["rfo"] = "ipp/faxout";
    return txt;
}

std::string textAt(const FakePrintSystem::Creation& creation, std::string_view key) {
    const auto* text = findText(creation.attributes, key);
    return text == nullptr ? "(none)" : *text;
}

// Creation and option selection are in memory; the existing queues are those of a real scheduler.
class IppUsbQueue : public testing::Test {
protected:
    IppUsbQueue() {
        setenv("TMPDIR", temporaryFiles_.path().c_str(), 1);
        selection_.newPPDText = "the printer's own";
    }
    ~IppUsbQueue() override { unsetenv("TMPDIR"); }

    void TearDown() override {
        EXPECT_TRUE(fs::is_empty(temporaryFiles_.path()))
            << fs::directory_iterator(temporaryFiles_.path())->path();
        EXPECT_EQ(system_.contextsAlive, 0);
    }

    std::int32_t make(std::optional<DeviceDescription> txt) {
        printer_.setTxtDictionary(std::move(txt));
        return QueueMaker(fake_.platform, drivers_).createQueueForDevice(printer_);
    }

    TemporaryFolder temporaryFiles_;
    PrivateScheduler scheduler_;
    UseScheduler use_{scheduler_};
    FakePlatform fake_;
    PPDManager drivers_{fake_.platform};
    IPPUSBObject printer_{drivers_, "Laser (USB)"};
    FakePrintSystem& system_ = fake_.printSystem;
    FakeAutoSelection& selection_ = fake_.printSystem.autoSelection;
};

TEST_F(IppUsbQueue, IsMadeWithThePPDThatThePrinterWasAskedFor) {
    EXPECT_EQ(make(kLaser), 0);
    ASSERT_EQ(system_.creations.size(), 1U);
    const auto& made = system_.creations.front();
    EXPECT_EQ(made.ppdText, "the printer's own");
    EXPECT_EQ(textAt(made, "Printer URI"), kIppUsbURI);
    EXPECT_EQ(textAt(made, "MODEL:"), "Acme");
    EXPECT_EQ(textAt(made, "MANUFACTURER:"), "Laser");
    EXPECT_EQ(textAt(made, "Location"), "Reading Room");
    EXPECT_EQ(made.options.at("PC WSItem User Name"), "Acme Laser");
    EXPECT_EQ(printer_.queueID(), "Acme_Laser");
}

TEST_F(IppUsbQueue, NamesNoPPDWhenThePrinterGaveNone) {
    selection_.newPPDText.reset();
    EXPECT_EQ(make(kLaser), 0);
    ASSERT_EQ(system_.creations.size(), 1U);
    EXPECT_EQ(textAt(system_.creations.front(), QueueAttributeKeys::kPPD), "(none)");
}

TEST_F(IppUsbQueue, SelectsOptionsOfTheGenericDriverOnABinaryChannel) {
    std::string generic;
    selection_.onSelect = [&](FakeAutoSelection&, const std::string& path) { generic = readFile(path); };
    make(kLaser);
    EXPECT_EQ(generic, readFile(*drivers_.genericURFPPD().name));
    EXPECT_EQ(system_.binaryOK, std::vector{true});
}

TEST_F(IppUsbQueue, BecomesTheDefaultWhenThePrintSystemWantsThat) {
    make(kLaser);
    EXPECT_EQ(system_.defaults, std::vector<std::string>{"Acme_Laser"});
}

TEST_F(IppUsbQueue, LeavesTheDefaultAloneOtherwise) {
    system_.makesDefault = false;
    make(kLaser);
    EXPECT_TRUE(system_.defaults.empty());
}

TEST_F(IppUsbQueue, IsNotMadeForAPrinterThatIsKnownByItsUsbURI) {
    scheduler_.addQueue("Old", kUsbURI);
    EXPECT_EQ(make(faxing(kLaser)), 242);
    EXPECT_EQ(printer_.queueID(), "Old");
    EXPECT_TRUE(system_.creations.empty());
    EXPECT_TRUE(system_.autoSelected.empty());
}

TEST_F(IppUsbQueue, IsNotMadeWhereThereIsOneAlready) {
    scheduler_.addQueue("Mine", kIppUsbURI);
    EXPECT_EQ(make(kLaser), 242);
    EXPECT_EQ(printer_.queueID(), "Mine");
}

TEST_F(IppUsbQueue, IsNotMadeWhereThereIsOnlyAFaxQueue) {
    scheduler_.addQueue("Fax", kIppUsbURI, kFaxPPD);
    EXPECT_EQ(make(faxing(kLaser)), 242);
    EXPECT_EQ(printer_.queueID(), "Fax");
}

TEST_F(IppUsbQueue, CountsAsThereWhileThePrinterTellsNothing) {
    for (const auto& txt : {std::optional<DeviceDescription>{}, std::optional{DeviceDescription{}}}) {
        EXPECT_EQ(make(txt), 242);
        EXPECT_EQ(printer_.queueID(), "");
    }
    EXPECT_TRUE(system_.creations.empty());
}

TEST_F(IppUsbQueue, ForgetsAnEarlierQueueThatIsGone) {
    printer_.setQueueID("Gone");
    system_.create = [](const auto&) { return 73; };
    EXPECT_EQ(make(kLaser), 73);
    EXPECT_EQ(printer_.queueID(), std::nullopt);
}

TEST_F(IppUsbQueue, NeedsTheGenericDriversFile) {
    const TemporaryFolder resources;
    fs::copy_file(fake_.resources.folder / "Vellum.ppd", resources / "Vellum.ppd");
    fake_.resources.folder = resources.path();
    drivers_.genericURFPPD();  // is looked up once
    fs::remove(resources / "Vellum.ppd");
    EXPECT_EQ(make(kLaser), 241);
}

TEST_F(IppUsbQueue, HandsUpWhyOptionsCouldNotBeSelected) {
    selection_.newPPDText.reset();
    selection_.optionsStatus = 4711;
    EXPECT_EQ(make(faxing(kLaser)), 4711);
    selection_.createStatus = -17;
    EXPECT_EQ(make(faxing(kLaser)), -17);
    EXPECT_TRUE(system_.creations.empty());
}

TEST_F(IppUsbQueue, HandsUpWhyTheQueueCouldNotBeMade) {
    system_.create = [](const auto&) { return 73; };
    EXPECT_EQ(make(faxing(kLaser)), 73);
    EXPECT_EQ(system_.autoSelected.size(), 1U);
    EXPECT_EQ(printer_.queueID(), std::nullopt);
}

class IppUsbFaxQueue : public IppUsbQueue {};

TEST_F(IppUsbFaxQueue, IsMadeBesideThePrinterQueue) {
    selection_.onSelect = [](FakeAutoSelection& selection, const std::string& path) {
        selection.newPPDText = path.ends_with(kFaxEnding) ? "its fax" : "its print";
    };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    ASSERT_EQ(system_.creations.size(), 2U);
    const auto& [print, fax] = std::pair(system_.creations[0], system_.creations[1]);
    EXPECT_EQ(print.ppdText, "its print");
    EXPECT_EQ(fax.ppdText, "its fax");
    EXPECT_EQ(textAt(fax, "Printer URI"), kIppUsbURI);
    EXPECT_EQ(textAt(fax, "MODEL:"), "Acme");
    EXPECT_EQ(textAt(fax, "Location"), "Reading Room");
    EXPECT_EQ(fax.options.at("PC WSItem User Name"), "Acme Laser 2");
    EXPECT_EQ(printer_.queueID(), print.queueID);
}

TEST_F(IppUsbFaxQueue, IsMadeFromTheGenericDriverUnderTheFaxDriversName) {
    std::vector<std::string> contents;
    selection_.onSelect = [&](FakeAutoSelection&, const std::string& path) {
        contents.push_back(readFile(path));
    };
    make(faxing(kLaser));
    ASSERT_EQ(system_.autoSelected.size(), 2U);
    EXPECT_EQ(system_.autoSelected[1], system_.autoSelected[0] + kFaxEnding);
    EXPECT_EQ(contents[1], contents[0]);
    EXPECT_EQ(system_.binaryOK, (std::vector{true, true}));
}

TEST_F(IppUsbFaxQueue, NeverBecomesTheDefault) {
    make(faxing(kLaser));
    EXPECT_EQ(system_.defaults, std::vector<std::string>{"Acme_Laser"});
}

TEST_F(IppUsbFaxQueue, IsNotMadeForAPrinterThatDoesNotFax) {
    auto txt = kLaser;
    txt["rfo"] = "ipp/other";
    EXPECT_EQ(make(txt), 0);
    EXPECT_EQ(system_.creations.size(), 1U);
    EXPECT_EQ(system_.autoSelected.size(), 1U);
}

TEST_F(IppUsbFaxQueue, IsNotMadeWhereThereIsOneAlready) {
    system_.create = [&](const auto&) {
        scheduler_.addQueue("Fax", kIppUsbURI, kFaxPPD);  // another process was faster
        return 0;
    };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    EXPECT_EQ(system_.creations.size(), 1U);
}

TEST_F(IppUsbFaxQueue, IsMadeWhereTheOtherQueueIsNoFaxQueue) {
    system_.create = [&](const auto& creation) {
        scheduler_.addQueue(creation.queueID, kIppUsbURI);
        return 0;
    };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    EXPECT_EQ(system_.creations.size(), 2U);
}

TEST_F(IppUsbFaxQueue, IsGivenUpWhenItsOptionsCannotBeSelected) {
    selection_.onSelect = [](FakeAutoSelection& selection, const std::string& path) {
        if (path.ends_with(kFaxEnding))
            selection.newPPDText.reset();
        selection.optionsStatus = path.ends_with(kFaxEnding) ? 69 : 0;
    };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    EXPECT_EQ(system_.creations.size(), 1U);
    EXPECT_EQ(printer_.queueID(), "Acme_Laser");
}

TEST_F(IppUsbFaxQueue, IsGivenUpWhenTheFaxServiceGivesNoPPD) {
    selection_.onSelect = [](FakeAutoSelection& selection, const std::string& path) {
        if (path.ends_with(kFaxEnding))
            selection.newPPDText.reset();
    };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    EXPECT_EQ(system_.autoSelected.size(), 2U);
    EXPECT_EQ(system_.creations.size(), 1U);
}

TEST_F(IppUsbFaxQueue, MayBeRefusedWithoutHarmToThePrinterQueue) {
    system_.create = [&](const auto&) { return system_.creations.size() == 1 ? 0 : 73; };
    EXPECT_EQ(make(faxing(kLaser)), 0);
    EXPECT_EQ(printer_.queueID(), "Acme_Laser");
    EXPECT_EQ(system_.removed, std::vector<std::string>{"Acme_Laser_2"});
}

// Whoever sees the temporary file knows the name that it will be moved to.
struct PlantedCase {
    const char* what;
    void (*plant)(const fs::path& path, const fs::path& victim);
};

constexpr PlantedCase kPlanted[] = {
    {"a file", [](const fs::path& path, const fs::path& victim) { fs::copy(victim, path); }},
    {"a link to a file",
     [](const fs::path& path, const fs::path& victim) { fs::create_symlink(victim, path); }},
    {"a link to nowhere",
     [](const fs::path& path, const fs::path& victim) {
         fs::create_symlink(victim.string() + "-gone", path);
     }},
    {"a folder", [](const fs::path& path, const fs::path&) { fs::create_directory(path); }},
};

TEST_F(IppUsbFaxQueue, IsNotMadeWhenSomethingStandsWhereItsPPDWouldGo) {
    const TemporaryFolder folder;
    const auto victim = folder.write("victim", "precious");
    for (const auto& row : kPlanted) {
        const auto* what = row.what;
        fs::path planted;
        selection_.onSelect = [&](FakeAutoSelection&, const std::string& path) {
            planted = path + kFaxEnding;
            row.plant(planted, victim);
        };
        system_.creations.clear();
        EXPECT_EQ(make(faxing(kLaser)), 0) << what;
        EXPECT_EQ(system_.creations.size(), 1U) << what;
        EXPECT_TRUE(fs::exists(fs::symlink_status(planted))) << what;
        fs::remove(planted);
        EXPECT_EQ(readFile(victim), "precious") << what;
        EXPECT_FALSE(fs::exists(victim.string() + "-gone")) << what;
        printer_.setQueueID(std::nullopt);
    }
}

}  // namespace
}  // namespace ventras
