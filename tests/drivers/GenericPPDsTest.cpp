#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "drivers/PPDManager.h"
#include "platform/PropertyList.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::Contains;
using testing::HasSubstr;
using testing::Not;

const std::filesystem::path kData = VENTRAS_SOURCE_DATA_DIR;

class GenericPPD : public testing::TestWithParam<const char*> {
protected:
    std::filesystem::path path_ = kData / (std::string(GetParam()) + ".ppd");
};

INSTANTIATE_TEST_SUITE_P(All, GenericPPD, testing::Values("Vellum", "Generic", "Fax"),
                         [](const auto& test) { return std::string(test.param); });

TEST_P(GenericPPD, Conforms) {
    const auto run = runProgram({"cupstestppd", "-v", "-v", path_});
    EXPECT_EQ(run.exitStatus, 0) << run.standardOutput << run.standardError;
    EXPECT_THAT(run.standardOutput, HasSubstr("NO ERRORS FOUND"));
    EXPECT_THAT(run.standardOutput, Not(HasSubstr("WARN")));
    EXPECT_THAT(run.standardOutput, Not(HasSubstr("FAIL")));
}

TEST_P(GenericPPD, HasCommonPaperOfBothContinents) {
    const PpdPtr ppd{ppdOpenFile(path_.c_str())};
    for (const auto* size : {"A4", "Letter", "Legal", "A5"})
        EXPECT_NE(ppdPageSize(ppd.get(), size), nullptr) << size;
}

TEST_P(GenericPPD, IsOfNoMakerWhoseDevicesItWouldMatch) {
    const auto record = PPDManager::parsePPD(path_).value();
    EXPECT_EQ(record.make, "Generic");
    EXPECT_EQ(record.modelNumber, std::nullopt);
}

TEST(GenericPPDs, HaveTheKindAndTypeOfTheirPurpose) {
    FakePlatform fakes;
    PPDManager manager(fakes.platform);
    EXPECT_EQ(PPDManager::ppdKind(manager.genericURFPPD()), 1U);
    EXPECT_FALSE(PPDManager::isFaxPPD(manager.genericURFPPD()));
    EXPECT_TRUE(PPDManager::isFaxPPD(manager.genericFaxPPD()));
    EXPECT_EQ(PPDManager::ppdKind(manager.genericFaxPPD()), 3U);
    EXPECT_TRUE(PPDManager::isPostscriptPPD(manager.genericSystemPPD("Generic")));
    EXPECT_EQ(manager.genericSystemPPD("Generic").languageLevel, 2);
}

class QueueWithGenericPPD : public testing::Test {
protected:
    void addQueue(const std::string& name, const std::string& uri, const char* ppd) {
        scheduler_.addQueue(name, uri, readFile(kData / ppd));
    }

    /// The beginning of what arrives at the printer.
    std::string printed(const std::string& document, const std::vector<std::string>& options = {}) {
        VirtualPrinter printer({.name = "Generic", .duplex = true, .colour = true});
        addQueue("Q", printer.uri(), "Vellum.ppd");
        scheduler_.print("Q", document, options);
        EXPECT_TRUE(printer.receivedWithin(30s)) << scheduler_.errorLog() << printer.log();
        const auto received = printer.received();
        return received.empty() ? "" : readFile(received[0].file);
    }

    PrivateScheduler scheduler_;
};

/// The header of a URF page: after 12 bytes of the file's own.
struct UrfPage {
    int bitsPerPixel, duplex, width, height;
};

UrfPage firstPage(const std::string& urf) {
    const auto byte = [&](std::size_t at) {
        return static_cast<int>(static_cast<unsigned char>(urf.at(12 + at)));
    };
    return {byte(0), byte(2), byte(14) << 8 | byte(15), byte(18) << 8 | byte(19)};
}

TEST_F(QueueWithGenericPPD, PrintsURFInColourOnA4) {
    const auto urf = printed("hello.pdf");
    ASSERT_TRUE(urf.starts_with(std::string_view("UNIRAST\0", 8)));
    const auto page = firstPage(urf);
    EXPECT_EQ(page.bitsPerPixel, 24);
    EXPECT_EQ(page.duplex, 1);
    EXPECT_EQ(page.width, 2480);
    EXPECT_NEAR(page.height, 3508, 1);
}

TEST_F(QueueWithGenericPPD, PrintsTextOnBothSidesInGrayOnLetterWhenAsked) {
    const auto urf = printed(
        "hello.txt", {"sides=two-sided-long-edge", "media=Letter", "ColorModel=Gray", "Resolution=600dpi"});
    ASSERT_TRUE(urf.starts_with(std::string_view("UNIRAST\0", 8)));
    const auto page = firstPage(urf);
    EXPECT_EQ(page.bitsPerPixel, 8);
    EXPECT_EQ(page.duplex, 3);
    EXPECT_EQ(page.width, 5100);
    EXPECT_EQ(page.height, 6600);
}

TEST_F(QueueWithGenericPPD, SendsPostscriptThroughThePostscriptOne) {
    addQueue("Ps", "usb://Acme/Jet", "Generic.ppd");
    const auto sink = scheduler_.sinkFile("Ps", scheduler_.print("Ps", "hello.pdf"));
    ASSERT_TRUE(PrivateScheduler::appears(sink)) << scheduler_.errorLog();
    EXPECT_THAT(readFile(sink), HasSubstr("%!PS-Adobe-"));
}

TEST_F(QueueWithGenericPPD, IsAFaxQueueWithTheFaxOne) {
    constexpr unsigned kFax = 0x40000;
    addQueue("Fax", "ipp://localhost/ipp/faxout", "Fax.ppd");
    addQueue("Print", "ipp://localhost/ipp/print", "Vellum.ppd");
    EXPECT_NE(std::stoul(scheduler_.attribute("Fax", "printer-type")) & kFax, 0U);
    EXPECT_EQ(std::stoul(scheduler_.attribute("Print", "printer-type")) & kFax, 0U);
}

TEST(NoSerialNumberList, IsAnEmptyDictionary) {
    const auto list = parsePropertyList(readFile(kData / "NoSerialNumber.xml"));
    ASSERT_TRUE(list);
    EXPECT_EQ(*list, PropertyValue(PropertyDictionary{}));
}

}  // namespace
}  // namespace ventras
