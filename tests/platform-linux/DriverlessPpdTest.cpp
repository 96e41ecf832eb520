#include "platform/linux/options/DriverlessPpd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

#include "platform/linux/ppd/DriverRules.h"
#include "platform/linux/ppd/PpdFile.h"
#include "tests/parts/OpenedPpd.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PrinterDescription.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using testing::Not;

std::string ppdOf(const Description& description, PrinterService service = PrinterService::Print) {
    auto outcome = driverlessPPD(description.capabilities(service).get(), service);
    const auto* file = std::get_if<TemporaryFile>(&outcome);
    return file == nullptr ? std::string() : readFile(file->path());
}

TEST(DriverlessPpd, OffersTheTraysAndTypesOfThePrinter) {
    std::vector<IppPtr> database;
    database.push_back(media(size(21000, 29700), "tray-1", "stationery"));
    database.push_back(media(size(21590, 27940), "manual", "photographic-glossy"));
    Description description;
    description.collections("media-col-database", database)
        .text(IPP_TAG_KEYWORD, "media-source-supported", {"tray-1", "manual"})
        .text(IPP_TAG_KEYWORD, "media-type-supported", {"stationery", "photographic-glossy"});
    const auto ppd = ppdOf(description);
    EXPECT_THAT(ppd, HasSubstr("*InputSlot Tray1/"));
    EXPECT_THAT(ppd, HasSubstr("*InputSlot Manual/"));
    EXPECT_THAT(ppd, HasSubstr("*MediaType PhotographicGlossy/"));
    EXPECT_THAT(ppd, Not(HasSubstr("*InputSlot Tray2")));
    EXPECT_THAT(ppd, HasSubstr("*cupsSNMPSupplies: False"));
}

TEST(DriverlessPpd, HasReadableNamesForSizesInInches) {
    std::vector<IppPtr> database;
    database.push_back(media(size(10160, 15240), "tray-1", "stationery"));
    Description description;
    description.collections("media-col-database", database);
    const auto ppd = openedPpd(ppdOf(description));
    ASSERT_TRUE(ppd);
    const auto* choice = ppdFindChoice(ppdFindOption(ppd.get(), "PageSize"), "4x6");
    ASSERT_NE(choice, nullptr);
    EXPECT_STREQ(choice->text, "4 x 6\xE2\x80\xB3");
}

TEST(DriverlessPpd, IsNotMadeFromNothing) {
    const IppPtr empty{ippNew()};
    EXPECT_TRUE(std::holds_alternative<std::string>(driverlessPPD(empty.get(), PrinterService::Print)));
    Description description;
    description.text(IPP_TAG_MIMETYPE, "document-format-supported", {"application/octet-stream"});
    removeAttribute(description.get(), "urf-supported");
    EXPECT_EQ(ppdOf(description), "");
}

TEST(DriverlessPpd, IsAFaxDriverForTheFaxServiceOnly) {
    EXPECT_THAT(ppdOf({}, PrinterService::FaxOut), HasSubstr("*cupsFax: True"));
    EXPECT_THAT(ppdOf({}, PrinterService::Print), Not(HasSubstr("*cupsFax")));
}

// Printers that would like to write lines of their own into the PPD
// -------------------------------------------

const std::string kEvil = "*cupsFilter: \"application/pdf 0 evil\"";

const std::string kHostileTexts[] = {
    "\"\n" + kEvil + "\n*%",
    "Acme\"\r" + kEvil + "\r*X: \"",
    "x/y: \"\n*End\n" + kEvil,
    "\n" + kEvil,
    ")>>setpagedevice (evil) run <<",
    "name with \"quotes\" and /slash: colon",
    std::string(10'000, 'A'),
    std::string(10'000, '"'),
    "\xff\xfe\xc3(",
    "\xC2\x85" + kEvil,
    "*cupsFax: True",
    "%s%n%s%n%1000000d",
    "../../../etc/passwd",
    "V1.4\nRS600\"",
    "RS99999999999999999999",
    "custom_max_99999999999x99999999999mm",
    "custom_min_-1x-1mm",
    "roll_current_0x0in",
    "",
};

constexpr const char* kTextAttributes[] = {
    "printer-make-and-model",
    "media-source-supported",
    "media-type-supported",
    "media-supported",
    "media-default",
    "media-ready",
    "output-bin-supported",
    "output-bin-default",
    "urf-supported",
    "sides-supported",
    "print-color-mode-supported",
    "print-color-mode-default",
    "output-mode-supported",
    "print-scaling-supported",
    "print-scaling-default",
    "document-format-supported",
    "print-content-optimize-supported",
    "print-rendering-intent-supported",
    "pwg-raster-document-type-supported",
    "pwg-raster-document-sheet-back",
    "printer-strings-uri",
    "printer-icons",
    "printer-more-info",
    "printer-charge-info-uri",
    "printer-device-id",
    "job-presets-supported",
    "finishing-template-supported",
    "ipp-features-supported",
    "printer-uri-supported",
};

constexpr ipp_tag_t kTextTags[] = {IPP_TAG_KEYWORD, IPP_TAG_NAME, IPP_TAG_TEXT, IPP_TAG_URI,
                                   IPP_TAG_MIMETYPE};

bool isOneOfOurs(char c) {
    return c == '\n' || (static_cast<unsigned char>(c) >= ' ' && c != '\x7f');
}

// There may be no PPD, but one that there is has no line of the printer's own.
void expectHarmless(const std::string& ppd, const std::string& what) {
    EXPECT_THAT(ppd, Not(HasSubstr("evil"))) << what;
    EXPECT_THAT(ppd, Not(HasSubstr("*cupsFilter:"))) << what;
    EXPECT_THAT(ppd, Not(HasSubstr("*cupsFax"))) << what;
    EXPECT_THAT(ppd, Not(HasSubstr("URI"))) << what;
    EXPECT_THAT(ppd, Not(HasSubstr("passwd"))) << what;
    EXPECT_TRUE(std::ranges::all_of(ppd, isOneOfOurs)) << what;
    EXPECT_LT(ppd.size(), 1'000'000U) << what;
}

TEST(DriverlessPpd, HasNoLineThatAPrintersTextSmugglesIn) {
    for (const auto* name : kTextAttributes)
        for (const auto& text : kHostileTexts)
            for (const auto tag : kTextTags) {
                Description description;
                description.text(tag, name, {"good", text});
                expectHarmless(ppdOf(description), std::string(name) + " = " + text.substr(0, 40));
            }
}

TEST(DriverlessPpd, HasNoLineThatAMemberOfACollectionSmugglesIn) {
    for (const auto& text : kHostileTexts) {
        std::vector<IppPtr> database;
        database.push_back(media(size(21000, 29700), text, "stationery"));
        database.push_back(media(size(21590, 27940), "tray-1", text));
        Description description;
        description.collections("media-col-database", database);
        description.collections("media-col-ready", database);
        expectHarmless(ppdOf(description), text.substr(0, 40));
    }
}

TEST(DriverlessPpd, SurvivesAbsurdNumbers) {
    constexpr int kNumbers[] = {0, -1, 1, 3, 7, 126, 32767, 1'000'000, 2'147'483'647, -2'147'483'647 - 1};
    for (const int x : kNumbers)
        for (const int y : kNumbers) {
            std::vector<IppPtr> sizes;
            sizes.push_back(size(x, y));
            std::vector<IppPtr> database;
            database.push_back(media(size(x, y), "tray-1", "stationery"));
            Description description;
            description.collections("media-size-supported", sizes)
                .collections("media-col-database", database)
                .numbers(IPP_TAG_INTEGER, "media-top-margin-supported", {x, y})
                .numbers(IPP_TAG_INTEGER, "media-left-margin-supported", {y, x})
                .numbers(IPP_TAG_ENUM, "finishings-supported", {x, y})
                .numbers(IPP_TAG_ENUM, "print-quality-supported", {x, y})
                .numbers(IPP_TAG_INTEGER, "job-password-supported", {x});
            removeAttribute(description.get(), "printer-resolution-supported");
            ippAddResolution(description.get(), IPP_TAG_PRINTER, "printer-resolution-supported",
                             IPP_RES_PER_INCH, x, y);
            expectHarmless(ppdOf(description), std::to_string(x) + " x " + std::to_string(y));
        }
}

IppPtr nested(int depth) {
    IppPtr inner{ippNew()};
    if (depth > 0)
        ippAddCollection(inner.get(), IPP_TAG_ZERO, "media-size", nested(depth - 1).get());
    return inner;
}

TEST(DriverlessPpd, SurvivesDeepCollections) {
    std::vector<IppPtr> database;
    database.push_back(nested(500));
    Description description;
    description.collections("media-col-database", database).collections("media-size-supported", database);
    expectHarmless(ppdOf(description), "nested collections");
    EXPECT_EQ(ippFindAttribute(description.capabilities().get(), "media-size-supported", IPP_TAG_ZERO),
              nullptr);
}

// Each attribute is dropped, or taken over by random bytes, now and then.
TEST(DriverlessPpd, SurvivesRandomDescriptions) {
    std::mt19937 random(20240607);
    const auto below = [&random](std::size_t limit) { return random() % limit; };
    for (int round = 0; round < 300; ++round) {
        Description description;
        for (const auto* name : kTextAttributes) {
            if (below(3) != 0)
                continue;
            std::vector<std::string> values(1 + below(4));
            for (auto& value : values)
                for (auto length = below(60); length > 0; --length)
                    value += static_cast<char>(1 + below(255));
            description.text(kTextTags[below(std::size(kTextTags))], name, values);
        }
        auto outcome = driverlessPPD(description.capabilities().get(), PrinterService::Print);
        if (const auto* file = std::get_if<TemporaryFile>(&outcome)) {
            EXPECT_FALSE(objectionToDriver(PpdFile::open(file->path()), DriverKind::Driverless)) << round;
            EXPECT_TRUE(std::ranges::all_of(readFile(file->path()), isOneOfOurs)) << round;
        }
    }
}

}  // namespace
}  // namespace ventras
