#include "queues/ScannerPPDRewrite.h"

#include <gtest/gtest.h>
#include <sys/resource.h>

#include <csignal>
#include <string>
#include <vector>

#include "tests/fakes/FakePrintSystem.h"
#include "tests/queues/OwnTemporaryFiles.h"

namespace ventras {
namespace {

using Text = std::optional<std::string>;

const std::string kPPD =
    "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*ModelName: \"Laser\"\n*OpenUI *PageSize: PickOne\n"
    "*DefaultPageSize: A4\n*PageSize A4: \"x\"\n*CloseUI: *PageSize\n";

const std::string kScanner =
    "*QLScannerUUID: \"12-34\"\n*QLScannerModulePath: \"/lib/x.so\"\n*QLICADriver: \"True\"\n\n";

class ScannerRewrite : public testing::Test {
protected:
    // What the queue's PPD becomes; absent when it is left alone.
    Text rewritten(const std::string& ppd, const Text& modulePath = "/lib/x.so") {
        printSystem_.queuePPDs = {{"Office", ppd}};
        printSystem_.setPPDs.clear();
        EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, "Office", "12-34", modulePath), 0);
        EXPECT_LE(printSystem_.setPPDs.size(), 1U);
        if (printSystem_.setPPDs.empty())
            return std::nullopt;
        EXPECT_EQ(printSystem_.setPPDs[0].first, "Office");
        return printSystem_.setPPDs[0].second;
    }

    void TearDown() override { EXPECT_EQ(files_.left(), std::vector<std::string>{}); }

    OwnTemporaryFiles files_;
    FakePrintSystem printSystem_;
};

TEST_F(ScannerRewrite, NeedsAQueueAndAUUID) {
    printSystem_.queuePPDs = {{"Office", kPPD}};
    EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, std::nullopt, "12-34", "/lib/x.so"), -1);
    EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, "Office", std::nullopt, "/lib/x.so"), -1);
    EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, std::nullopt, std::nullopt, std::nullopt), -1);
    EXPECT_EQ(printSystem_.setPPDs.size(), 0U);
}

TEST_F(ScannerRewrite, AppendsTheScannerToThePPD) {
    EXPECT_EQ(rewritten(kPPD), kPPD + kScanner);
}

TEST_F(ScannerRewrite, LeavesOutAModulePathThatIsNotKnown) {
    EXPECT_EQ(rewritten(kPPD, std::nullopt), kPPD + "*QLScannerUUID: \"12-34\"\n*QLICADriver: \"True\"\n\n");
}

TEST_F(ScannerRewrite, LeavesAQueueAloneThatNamesTheScanner) {
    EXPECT_EQ(rewritten(kPPD + "*QLScannerUUID: \"12-34\"\n"), std::nullopt);
    EXPECT_EQ(rewritten(kPPD + "*QLScannerUUID: \"12-34\"\n*QLScannerModulePath: \"/old.so\"\n"),
              std::nullopt);
}

TEST_F(ScannerRewrite, IsRepeatedWithoutEffect) {
    const auto once = rewritten(kPPD);
    ASSERT_TRUE(once.has_value());
    EXPECT_EQ(rewritten(*once), std::nullopt);
}

TEST_F(ScannerRewrite, ReplacesWhatWasRecordedBefore) {
    const std::string older =
        "*QLScannerUUID: \"99\"\n*QLScannerModulePath: \"/old.so\"\n*QLICADriver: \"True\"\n\n";
    EXPECT_EQ(rewritten(kPPD + older), kPPD + "\n" + kScanner);
    EXPECT_EQ(rewritten(kPPD + older, std::nullopt),
              kPPD + "\n*QLScannerUUID: \"12-34\"\n*QLICADriver: \"True\"\n\n");
}

TEST_F(ScannerRewrite, TakesOutEveryLineThatBeginsLikeAScannerKeyword) {
    const std::string prefix = "*PPD-Adobe: \"4.3\"\n";
    const std::vector<std::pair<std::string, bool>> lines{
        {"*QLScannerUUID: \"99\"\n", false},         {"*QLScannerUUID", false},
        {"*QLScannerUUIDs: \"99\"\n", false},        {"*QLScannerModulePath: \"/x\"\n", false},
        {"*QLScannerModulePaths: 1\r\n", false},     {"*QLICADriver: \"False\"\n", false},
        {"*QLICADriverVersion: 2\n", false},         {"*QLScannerOnly: True\n", true},
        {"*qlScannerUUID: \"99\"\n", true},          {" *QLScannerUUID: \"99\"\n", true},
        {"*% *QLScannerUUID: \"99\"\n", true},       {"*QLICADrive: 1\n", true},
        {"*OpenUI *QLScannerUUID: PickOne\n", true}, {"*QLScannerModulePat: 1\n", true},
    };
    for (const auto& [line, isKept] : lines)
        EXPECT_EQ(rewritten(prefix + line), prefix + (isKept ? line : "") + kScanner) << line;
}

TEST_F(ScannerRewrite, CopiesLinesByteForByte) {
    const std::vector<std::string> lines{
        "*X: \"a\"\r\n",
        "*X: \"\xff\xfe\"\n",
        std::string("*X: \"a\0b\"\n", 10),
        "\n\n",
        "*X: \"" + std::string(1025, 'a') + "\"\n",
        "*X: \"" + std::string(5000, 'b') + "\"\n",
        std::string(1025, 'c') + "\n",
    };
    for (const auto& line : lines)
        EXPECT_EQ(rewritten(kPPD + line), kPPD + line + kScanner) << line;
}

TEST_F(ScannerRewrite, BeginsTheScannerOnALineOfItsOwn) {
    EXPECT_EQ(rewritten("*PPD-Adobe: \"4.3\"\n*X: 1"), "*PPD-Adobe: \"4.3\"\n*X: 1\n" + kScanner);
}

TEST_F(ScannerRewrite, HandsOverTheScannerAloneWhenThePPDCannotBeFetched) {
    printSystem_.queuePPDs.clear();
    EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, "Office", "12-34", "/lib/x.so"), 0);
    EXPECT_EQ(printSystem_.setPPDs, (std::vector<std::pair<std::string, std::string>>{{"Office", kScanner}}));
}

TEST_F(ScannerRewrite, CopiesAFileThatIsNoPPDToo) {
    EXPECT_EQ(rewritten("*QLScannerUUID: \"12-34\"\nno PPD\n"), "no PPD\n" + kScanner);
    EXPECT_EQ(rewritten(""), kScanner);
}

/// While it lives, this process cannot make files larger than that: to a writer, a full disk.
class FileSizeLimit {
public:
    explicit FileSizeLimit(rlim_t bytes) {
        getrlimit(RLIMIT_FSIZE, &before_);
        const rlimit limit{bytes, before_.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
        std::signal(SIGXFSZ, SIG_IGN);
    }
    ~FileSizeLimit() {
        setrlimit(RLIMIT_FSIZE, &before_);
        std::signal(SIGXFSZ, SIG_DFL);
    }
    FileSizeLimit(const FileSizeLimit&) = delete;
    FileSizeLimit& operator=(const FileSizeLimit&) = delete;

private:
    rlimit before_{};
};

TEST_F(ScannerRewrite, InstallsNoHalfOfAPPDWhenTheDiskIsFull) {
    const std::string ppd = kPPD + std::string(20000, 'x') + "\n";
    printSystem_.queuePPDs = {{"Office", ppd}};
    {
        const FileSizeLimit limit(ppd.size() + 10);
        EXPECT_EQ(rewriteQueuePPDForScanner(printSystem_, "Office", "12-34", "/lib/x.so"), 0);
    }
    EXPECT_EQ(printSystem_.setPPDs.size(), 0U);
}

}  // namespace
}  // namespace ventras
