#include <gmock/gmock.h>

#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::IsEmpty;

class RegisteredDrivers : public testing::Test {
protected:
    void SetUp() override { fs::create_directories(drv()); }

    fs::path data() const { return scheduler_.folder() / "data"; }
    fs::path drv() const { return data() / "drv"; }

    void install(const std::string& collection) const {
        fs::copy_file(fs::path("/usr/share/cups/drv") / collection, drv() / collection);
    }

    int registerDrivers() const {
        return runProgram({VENTRAS_REGISTER_DRIVERS, data(), ppds_.path()}).exitStatus;
    }

    static std::vector<std::string> namesIn(const fs::path& folder) {
        std::vector<std::string> names;
        for (const auto& entry : fs::directory_iterator(folder))
            names.push_back(entry.path().filename());
        std::ranges::sort(names);
        return names;
    }

    // The kinds of the catalogue's records whose name begins so.
    std::vector<unsigned> kindsOf(const std::string& beginning) {
        const UseScheduler use(scheduler_.address());
        FakePlatform fake;
        std::vector<unsigned> kinds;
        for (const auto& record : PPDManager(fake.platform).ppds())
            if (record.name.value_or("").starts_with(beginning))
                kinds.push_back(PPDManager::ppdKind(record));
        return kinds;
    }

    TemporaryFolder ppds_;
    PrivateScheduler scheduler_{{.models = {{}}}};
};

TEST_F(RegisteredDrivers, CountAsInstalled) {
    install("sample.drv");
    EXPECT_THAT(kindsOf("drv:///Library/"), IsEmpty());
    ASSERT_EQ(registerDrivers(), 0);
    const auto kinds = kindsOf("drv:///Library/sample.drv/");
    EXPECT_GT(kinds.size(), 10U);
    EXPECT_THAT(kinds, testing::Each(testing::Le(3U)));
}

TEST_F(RegisteredDrivers, MayBePPDFilesInFolders) {
    fs::create_directory(ppds_ / "acme");
    fs::copy_file(fs::path(VENTRAS_SOURCE_DATA_DIR) / "Generic.ppd", ppds_ / "acme/laser.ppd");
    ASSERT_EQ(registerDrivers(), 0);
    EXPECT_EQ(kindsOf("Library/Printers/acme/laser.ppd").size(), 1U);
}

TEST_F(RegisteredDrivers, MayBePPDFilesAmongTheSchedulersOwn) {
    fs::create_directories(data() / "model/acme");
    fs::copy_file(fs::path(VENTRAS_SOURCE_DATA_DIR) / "Generic.ppd", data() / "model/acme/laser.ppd");
    fs::copy_file(fs::path(VENTRAS_SOURCE_DATA_DIR) / "Generic.ppd", data() / "model/other.ppd");
    fs::create_directory(ppds_ / "zenith");
    for (int times = 0; times < 2; ++times) {
        ASSERT_EQ(registerDrivers(), 0);
        EXPECT_THAT(namesIn(data() / "model/Library/Printers"),
                    ElementsAre("laser.ppd", "other.ppd", "zenith"));
    }
    for (const std::string name : {"laser.ppd", "other.ppd"})
        EXPECT_EQ(kindsOf("Library/Printers/" + name).size(), 1U) << name;
}

TEST_F(RegisteredDrivers, FollowThePackagesThatComeAndGo) {
    install("sample.drv");
    install("cupsfilters.drv");
    ASSERT_EQ(registerDrivers(), 0);
    EXPECT_THAT(namesIn(drv() / "Library"), ElementsAre("cupsfilters.drv", "sample.drv"));
    fs::remove(drv() / "cupsfilters.drv");
    ASSERT_EQ(registerDrivers(), 0);
    EXPECT_THAT(namesIn(drv() / "Library"), ElementsAre("sample.drv"));
}

TEST_F(RegisteredDrivers, MayBeNone) {
    ASSERT_EQ(registerDrivers(), 0);
    EXPECT_THAT(namesIn(drv() / "Library"), IsEmpty());
    EXPECT_THAT(namesIn(data() / "model/Library/Printers"), IsEmpty());
}

TEST_F(RegisteredDrivers, CanBeTakenAway) {
    install("sample.drv");
    fs::create_directory(ppds_ / "acme");
    ASSERT_EQ(registerDrivers(), 0);
    for (int times = 0; times < 2; ++times) {
        EXPECT_EQ(runProgram({VENTRAS_REGISTER_DRIVERS, "--none", data(), ppds_.path()}).exitStatus, 0);
        EXPECT_THAT(namesIn(drv()), ElementsAre("sample.drv"));
        EXPECT_FALSE(fs::exists(data() / "model/Library"));
    }
}

TEST_F(RegisteredDrivers, AreLinksBesideWhatOthersPutThere) {
    fs::create_directories(drv() / "Library");
    fs::copy_file("/usr/share/cups/drv/sample.drv", drv() / "Library/own.drv");
    ASSERT_EQ(registerDrivers(), 0);
    EXPECT_THAT(namesIn(drv() / "Library"), ElementsAre("own.drv"));
}

}  // namespace
}  // namespace ventras
