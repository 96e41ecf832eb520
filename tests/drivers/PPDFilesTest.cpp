#include "drivers/PPDFiles.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <random>

#include "drivers/PPDManager.h"
#include "tests/drivers/PPDText.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/BlackHole.h"
#include "tests/parts/PrivateScheduler.h"

namespace ventras {
namespace {

using testing::IsEmpty;
using testing::UnorderedElementsAre;

std::string content(const std::optional<std::string>& path) {
    return path ? readFile(*path) : "nothing";
}

/// More than a few blocks, and nothing that compresses well.
std::string longPPD() {
    std::mt19937 random(4);
    std::vector<std::string> lines;
    for (int i = 0; i < 5000; ++i)
        lines.push_back("*% " + std::to_string(random()));
    return ppdText(lines);
}

class CopyOfPPD : public testing::Test {
protected:
    std::optional<std::string> copy(const std::optional<std::string>& path) const {
        return manager_.ppdFileWithName(path);
    }

    void expectNothingFor(const std::string& path) const {
        EXPECT_EQ(copy(path), std::nullopt) << path;
        EXPECT_THAT(temporary_.paths(), IsEmpty()) << path;
    }

    FakePlatform fakes_;
    PPDManager manager_{fakes_.platform};
    TemporaryFolder folder_;
    OwnTemporaryFiles temporary_;
};

TEST_F(CopyOfPPD, IsANewTemporaryFileEachTime) {
    const auto path = folder_.write("a.ppd", longPPD());
    const auto first = copy(path), second = copy(path);
    EXPECT_EQ(content(first), longPPD());
    EXPECT_EQ(content(second), longPPD());
    EXPECT_THAT(temporary_.paths(), UnorderedElementsAre(first.value(), second.value()));
}

TEST_F(CopyOfPPD, IsForItsOwnerOnly) {
    struct stat status {};
    ASSERT_EQ(stat(copy(folder_.write("a.ppd", longPPD())).value().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0600U);
}

TEST_F(CopyOfPPD, IsDecompressed) {
    EXPECT_EQ(content(copy(writeCompressed(folder_, "a.ppd.gz", longPPD()))), longPPD());
}

TEST_F(CopyOfPPD, HasWhatEverTheFileHas) {
    const std::string bytes("\0\x1f\xff\n", 4);
    EXPECT_EQ(content(copy(folder_.write("a", bytes))), bytes);
    EXPECT_EQ(content(copy(folder_.write("b", std::string(8192, 'x')))), std::string(8192, 'x'));
}

TEST_F(CopyOfPPD, IsNothingForWhatIsNoFile) {
    EXPECT_EQ(copy(std::nullopt), std::nullopt);
    expectNothingFor("");
    expectNothingFor("/nonexistent.ppd");
    expectNothingFor(folder_.path());
    expectNothingFor("/dev/zero");
    const auto pipe = folder_ / "pipe";
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    expectNothingFor(pipe);
    expectNothingFor(folder_.write("empty", ""));
}

TEST_F(CopyOfPPD, IsNothingForADamagedCompressedFile) {
    const auto whole = readFile(writeCompressed(folder_, "a.ppd.gz", longPPD()));
    for (const std::size_t length : {whole.size() / 2, whole.size() - 9, whole.size() - 4, whole.size() - 1})
        expectNothingFor(folder_.write("cut-" + std::to_string(length), whole.substr(0, length)));
    auto damaged = whole;
    damaged[whole.size() / 2] ^= 0x55;
    expectNothingFor(folder_.write("damaged", damaged));
}

TEST_F(CopyOfPPD, IsNothingForAFileThatUnfoldsWithoutEnd) {
    expectNothingFor(writeCompressed(folder_, "bomb.gz", std::string(17 << 20, ' ')));
}

TEST_F(CopyOfPPD, IsNothingWhenTheDiskIsFull) {
    const auto path = folder_.write("a.ppd", longPPD());
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    for (const rlim_t room : {rlim_t{0}, rlim_t{10'000}, rlim_t{longPPD().size() - 1}}) {
        const rlimit limit{room, before.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
        const auto copied = copy(path);
        setrlimit(RLIMIT_FSIZE, &before);
        EXPECT_EQ(copied, std::nullopt) << room;
        EXPECT_THAT(temporary_.paths(), IsEmpty()) << room;
    }
    std::signal(SIGXFSZ, handler);
}

TEST_F(CopyOfPPD, IsNothingWithoutAFolderForIt) {
    const auto path = folder_.write("a.ppd", longPPD());
    setenv("TMPDIR", folder_.write("no-folder", "").c_str(), 1);
    EXPECT_EQ(copy(path), std::nullopt);
}

TEST_F(CopyOfPPD, LeavesNoFileOpen) {
    const auto path = folder_.write("a.ppd", longPPD());
    const auto descriptors = [] {
        const std::filesystem::directory_iterator open("/proc/self/fd");
        return std::distance(begin(open), end(open));
    };
    const auto before = descriptors();
    copy(path);
    copy("/nonexistent.ppd");
    copy(writeCompressed(folder_, "bomb.gz", std::string(65 << 20, ' ')));
    EXPECT_EQ(descriptors(), before);
}

class DriversPPD : public CopyOfPPD {
protected:
    std::optional<std::string> fetch(const std::string& name) const {
        PPDRecord record;
        record.name = name;
        return manager_.ppdFile(record);
    }

    PrivateScheduler scheduler_{{.models = {{{"jet.ppd", longPPD()}}}}};
    UseScheduler use_{scheduler_};
};

TEST_F(DriversPPD, WithAnAbsolutePathIsACopyOfThatFile) {
    const auto path = folder_.write("a.ppd", ppdText({}));
    EXPECT_EQ(content(fetch(path)), ppdText({}));
    EXPECT_EQ(fetch("/nonexistent.ppd"), std::nullopt);
    EXPECT_EQ(temporary_.paths().size(), 1U);
}

TEST_F(DriversPPD, WithAFileURLIsACopyOfTheFileBehindIt) {
    const auto path = folder_.write("a b#ü.ppd", ppdText({})).string();
    const auto folder = folder_.path().string();
    EXPECT_EQ(content(fetch("file://" + folder + "/a%20b%23%C3%BC.ppd")), ppdText({}));
    EXPECT_EQ(content(fetch("file://localhost" + folder + "/a%20b%23%c3%bc.ppd")), ppdText({}));
    EXPECT_EQ(content(fetch("file://" + folder + "/a b%23ü.ppd")), ppdText({}));
    for (const auto& url :
         {"file://" + folder + "/a%20b", "file://" + folder + "/%zz", std::string("file://"),
          "file://" + folder + "/a%00b", std::string("file:///nonexistent")})
        EXPECT_EQ(fetch(url), std::nullopt) << url;
    EXPECT_EQ(temporary_.paths().size(), 3U);
}

TEST_F(DriversPPD, OfTheServersCatalogueComesFromTheServer) {
    EXPECT_EQ(content(fetch("jet.ppd")), longPPD()) << scheduler_.errorLog();
    EXPECT_EQ(temporary_.paths().size(), 1U);
}

TEST_F(DriversPPD, ThatTheServerDoesNotKnowIsNothing) {
    for (const auto* name : {"other.ppd", "drv:///other.drv/a.ppd", "", "../jet.ppd", "everywhere"}) {
        EXPECT_EQ(fetch(name), std::nullopt) << name;
        EXPECT_THAT(temporary_.paths(), IsEmpty()) << name;
    }
    EXPECT_EQ(manager_.ppdFile(PPDRecord{}), std::nullopt);
}

/// The working folder for as long as it lives.
class WorkingFolder {
public:
    explicit WorkingFolder(const std::filesystem::path& folder) { std::filesystem::current_path(folder); }
    ~WorkingFolder() { std::filesystem::current_path(before_); }

private:
    std::filesystem::path before_ = std::filesystem::current_path();
};

TEST_F(DriversPPD, ThatTheServerDoesNotKnowMayBeAFileOfThatName) {
    folder_.write("local.ppd", ppdText({}));
    const WorkingFolder here(folder_.path());
    EXPECT_EQ(content(fetch("local.ppd")), ppdText({}));
    EXPECT_EQ(temporary_.paths().size(), 1U);
}

TEST_F(DriversPPD, ThatIsInstalledIsTheLocalizedOne) {
    fakes_.printSystem.localizedPPD = folder_.write("de.ppd", ppdText({"*LanguageVersion: German"}));
    for (const auto* name : {"Library/Printers/a.ppd", "System/Library/Printers/PPDs/a.ppd"})
        EXPECT_EQ(content(fetch(name)), ppdText({"*LanguageVersion: German"})) << name;
    for (const auto* name : {"/Library/Printers/a.ppd", "System/Library/a.ppd", "library/Printers/a.ppd"})
        EXPECT_EQ(fetch(name), std::nullopt) << name;
}

TEST_F(DriversPPD, ThatIsInstalledKeepsItsNameWithoutALocalizedOne) {
    fakes_.printSystem.localizedPPD.reset();
    folder_.write("Library/Printers/a.ppd", ppdText({}));
    const WorkingFolder here(folder_.path());
    EXPECT_EQ(content(fetch("Library/Printers/a.ppd")), ppdText({}));
    EXPECT_NE(scheduler_.accessLog().find("CUPS-Get-PPD "), std::string::npos) << scheduler_.accessLog();
}

TEST_F(DriversPPD, IsNothingWithoutTheServer) {
    scheduler_.stop();
    EXPECT_EQ(fetch("jet.ppd"), std::nullopt);
    EXPECT_THAT(temporary_.paths(), IsEmpty());
}

}  // namespace
}  // namespace ventras
