#include "platform/linux/ppd/DriverRules.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "platform/linux/ppd/PpdFile.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PpdTexts.h"

namespace ventras {
namespace {

using namespace std::string_literals;

class DriverRules : public testing::Test {
protected:
    PpdFile open(std::string_view text) { return PpdFile::open(folder_.write("driver.ppd", text)); }

    bool accepts(std::string_view text, DriverKind kind) { return !objectionToDriver(open(text), kind); }

    TemporaryFolder folder_;
};

std::string filter2(const std::string& program) {
    return ppdWith("*cupsFilter2: \"image/urf image/urf 0 " + program + "\"\n");
}

std::string filter1(const std::string& program) {
    return ppdWith("*cupsFilter: \"application/vnd.cups-raster 0 " + program + "\"\n");
}

TEST_F(DriverRules, LetDriverlessQueuesUseStockConvertersOnly) {
    for (const auto* program : {"-", "gstopxl", "rastertopclx", "rastertopwg", "pdftops", "maxsize(1000) -"})
        EXPECT_TRUE(accepts(filter2(program), DriverKind::Driverless)) << program;
    for (const auto* program : {"foomatic-rip", "rastertoacme", "/usr/lib/cups/filter/gstopxl",
                                "../backend/usb", "gstopxl; reboot", "gstopxl -x", "sh", "", "--"})
        EXPECT_FALSE(accepts(filter2(program), DriverKind::Driverless)) << program;
}

TEST_F(DriverRules, LetCatalogueDriversUseInstalledFilters) {
    for (const auto* program : {"-", "foomatic-rip", "rastertoacme", "hpcups", "raster.to-x+y_z",
                                "/usr/lib/cups/filter/rastertoacme", "/opt/acme/lib/cups/filter/acme"})
        EXPECT_TRUE(accepts(filter1(program), DriverKind::Catalogue)) << program;
    for (const auto* program :
         {"../backend/usb", "sub/filter", "/tmp/evil", "/usr/../tmp/evil", "/usr/lib/./x", "/usr//lib/x",
          "/home/user/x", ".hidden", "/usr/lib/cups/filter/", "a b", "a;b", "$(reboot)", "x\x01y"})
        EXPECT_FALSE(accepts(filter1(program), DriverKind::Catalogue)) << program;
}

TEST_F(DriverRules, LookAtEveryKindOfFilterLine) {
    for (const auto* line : {"*cupsFilter: \"application/pdf 0 evil\"\n",
                             "*cupsFilter2: \"application/pdf application/pdf 0 evil\"\n",
                             "*cupsPreFilter: \"application/pdf 0 evil\"\n",
                             "*CUPSFILTER2: \"application/pdf application/pdf 0 evil\"\n"}) {
        EXPECT_FALSE(accepts(driverlessPpdText() + line, DriverKind::Driverless)) << line;
    }
}

TEST_F(DriverRules, RefuseFilterLinesThatDoNotParse) {
    for (const auto* value : {"nonsense", "image/urf", "image/urf image/urf -", "image/urf image/urf x -",
                              "imageurf image/urf 0 -", "image/urf image/urf 0"})
        EXPECT_FALSE(
            accepts(ppdWith("*cupsFilter2: \"" + std::string(value) + "\"\n"), DriverKind::Driverless))
            << value;
}

TEST_F(DriverRules, LetAPpdWithoutFiltersPass) {
    for (const auto kind : {DriverKind::Driverless, DriverKind::Catalogue})
        EXPECT_TRUE(accepts(ppdWith(""), kind));
}

TEST_F(DriverRules, LetScannerQueuesHaveAPpdOnlyThatSaysSo) {
    EXPECT_FALSE(accepts(ppdWith(""), DriverKind::ScannerOnly));
    // A quotation mark in a name takes the next line into the text that it opens.
    EXPECT_FALSE(accepts(scannerPpdText("A\"=*B: \"C: \""), DriverKind::ScannerOnly));
}

TEST_F(DriverRules, LetScannerQueuesHaveNoFilterAtAll) {
    EXPECT_TRUE(accepts(scannerPpdText(), DriverKind::ScannerOnly));
    EXPECT_FALSE(
        accepts(scannerPpdText() + "*cupsFilter2: \"image/urf image/urf 0 -\"\n", DriverKind::ScannerOnly));
    EXPECT_FALSE(accepts(driverlessPpdText(), DriverKind::ScannerOnly));
}

TEST_F(DriverRules, HoldAPpdThatCallsItselfAScannersToThat) {
    EXPECT_FALSE(accepts(scannerPpdText() + "*cupsFilter: \"application/pdf 0 foomatic-rip\"\n",
                         DriverKind::Catalogue));
}

TEST_F(DriverRules, SeeAFilterThatAScannersNameSmugglesIn) {
    const auto text =
        scannerPpdText("x\"\n*QLScannerOnly: False\n*cupsFilter: \"application/pdf 0 evil\"\n*%");
    EXPECT_FALSE(accepts(text, DriverKind::ScannerOnly));
    EXPECT_FALSE(accepts(text, DriverKind::Catalogue));
}

TEST_F(DriverRules, RefuseWhatIsNoPpd) {
    for (const std::string_view text : {"", "hello", "*cupsFilter: \"application/pdf 0 -\"\n",
                                        "*QLScannerUUID: \"u\"\n*QLICADriver: \"True\"\n\n"})
        EXPECT_FALSE(accepts(text, DriverKind::Catalogue)) << text;
}

TEST_F(DriverRules, RefuseAFileThatIsNotThere) {
    EXPECT_TRUE(objectionToDriver(PpdFile::open((folder_ / "none.ppd").string()), DriverKind::Catalogue));
    EXPECT_TRUE(objectionToDriver(PpdFile::open(""), DriverKind::Catalogue));
}

TEST_F(DriverRules, RefuseWhatIsNoRegularFile) {
    const auto pipe = (folder_ / "pipe.ppd").string();
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    EXPECT_TRUE(objectionToDriver(PpdFile::open(pipe), DriverKind::Catalogue));
    EXPECT_TRUE(objectionToDriver(PpdFile::open(folder_.path().string()), DriverKind::Catalogue));
    const auto link = folder_ / "link.ppd";
    std::filesystem::create_symlink(folder_.write("driver.ppd", driverlessPpdText()), link);
    EXPECT_TRUE(objectionToDriver(PpdFile::open(link.string()), DriverKind::Catalogue));
}

TEST_F(DriverRules, RefuseAFileThatIsTooLarge) {
    const auto path = folder_.write("driver.ppd", driverlessPpdText());
    std::filesystem::resize_file(path, 17 * 1024 * 1024);
    EXPECT_EQ(PpdFile::open(path.string()).defect(), "the PPD is too large");
}

TEST_F(DriverRules, NameTheFilterLineThatTheyRefuse) {
    const auto objection = objectionToDriver(open(filter2("evil")), DriverKind::Driverless);
    ASSERT_TRUE(objection);
    EXPECT_NE(objection->find("cupsFilter2 image/urf image/urf 0 evil"), std::string::npos) << *objection;
}

TEST_F(DriverRules, LetAReplacementKeepOrDropFilters) {
    const auto present = open(filter1("rastertoacme") + "*cupsFilter2: \"image/urf image/urf 0 -\"\n");
    EXPECT_FALSE(objectionToReplacement(present, open(filter1("rastertoacme"))));
    EXPECT_FALSE(objectionToReplacement(present, open(ppdWith(""))));
}

TEST_F(DriverRules, LetNoReplacementAddAFilter) {
    const auto present = open(filter1("rastertoacme"));
    EXPECT_TRUE(objectionToReplacement(present, open(filter1("rastertoother"))));
    EXPECT_TRUE(objectionToReplacement(present, open(filter2("-"))));
    EXPECT_TRUE(objectionToReplacement(present, open("no ppd")));
}

// foomatic-rip runs what these lines say. It reads line by line, whatever libcups takes for one text.
const std::string kCommand = "*FoomaticRIPCommandLine: \"gs -q\"\n";

TEST_F(DriverRules, LetCatalogueDriversAloneHaveCommands) {
    for (const auto& lines :
         {kCommand, "*QLScannerUUID: \"x\n" + kCommand, "*foomaticripoptionsetting A=B: \"-x\"\n"s}) {
        EXPECT_TRUE(accepts(ppdWith(lines), DriverKind::Catalogue)) << lines;
        EXPECT_FALSE(accepts(ppdWith(lines), DriverKind::Driverless)) << lines;
        EXPECT_FALSE(accepts(scannerPpdText() + lines, DriverKind::ScannerOnly)) << lines;
    }
}

TEST_F(DriverRules, SeeAFilterThatIsHiddenInAText) {
    const std::string hidden = "*QLScannerUUID: \"x\n*cupsFilter: \"application/pdf 0 evil\"\n";
    EXPECT_FALSE(accepts(driverlessPpdText() + hidden, DriverKind::Driverless));
    EXPECT_FALSE(accepts(scannerPpdText() + hidden, DriverKind::ScannerOnly));
}

TEST_F(DriverRules, LetAReplacementKeepOrDropCommands) {
    const auto present = open(ppdWith(kCommand));
    EXPECT_FALSE(objectionToReplacement(present, open(ppdWith(kCommand + "*QLScannerUUID: \"u\"\n"))));
    EXPECT_FALSE(objectionToReplacement(present, open(ppdWith(""))));
}

TEST_F(DriverRules, LetNoReplacementAddACommand) {
    const auto present = open(ppdWith(kCommand));
    for (const auto* injected :
         {"u\"\n*FoomaticRIPCommandLine: \"evil", "u\n*FoomaticRIPCommandLine: evil",
          "u\"\r*FOOMATICRIPCommandLine: \"evil", "u\n*cupsFilter: \"application/pdf 0 evil"})
        EXPECT_TRUE(objectionToReplacement(
            present, open(ppdWith(kCommand + "*QLScannerUUID: \"" + injected + "\"\n"))))
            << injected;
}

TEST(PpdFile, SendsWhatItLookedAtEvenIfTheFileIsReplacedMeanwhile) {
    const TemporaryFolder folder;
    const auto path = folder.write("driver.ppd", driverlessPpdText());
    const auto ppd = PpdFile::open(path.string());
    std::filesystem::remove(path);
    folder.write("driver.ppd", filter2("evil"));
    std::string text(driverlessPpdText().size() + 100, '\0');
    text.resize(
        static_cast<std::size_t>(std::max<ssize_t>(0, read(ppd.descriptor(), text.data(), text.size()))));
    EXPECT_EQ(text, driverlessPpdText());
}

TEST(PpdFile, ReadsACompressedPpdToo) {
    const TemporaryFolder folder;
    const auto path = (folder / "driver.ppd.gz").string();
    auto* file = cupsFileOpen(path.c_str(), "w9");
    ASSERT_NE(file, nullptr);
    cupsFilePuts(file, filter2("evil").c_str());
    cupsFileClose(file);
    const auto ppd = PpdFile::open(path);
    EXPECT_EQ(ppd.defect(), "");
    ASSERT_EQ(ppd.filters().size(), 1U);
    EXPECT_EQ(ppd.filters().front().program, "evil");
}

}  // namespace
}  // namespace ventras
