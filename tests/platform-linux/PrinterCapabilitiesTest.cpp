#include "platform/linux/PrinterCapabilities.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

#include "platform/linux/CapabilityText.h"
#include "platform/linux/DriverRules.h"
#include "platform/linux/DriverlessPpd.h"
#include "platform/linux/PpdFile.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using testing::Not;

/// A printer's answer that a test builds up.
class Description {
public:
    Description() {
        ippSetVersion(message_.get(), 2, 0);
        ippSetStatusCode(message_.get(), IPP_STATUS_OK);
        ippAddString(message_.get(), IPP_TAG_OPERATION, IPP_TAG_CHARSET, "attributes-charset", nullptr,
                     "utf-8");
        ippAddString(message_.get(), IPP_TAG_OPERATION, IPP_TAG_LANGUAGE, "attributes-natural-language",
                     nullptr, "en");
        ippAddSeparator(message_.get());
        addDriverlessAttributes(message_.get(), {});
    }

    ipp_t* get() const { return message_.get(); }

    Description& text(ipp_tag_t tag, const char* name, const std::vector<std::string>& values) {
        removeAttribute(get(), name);
        std::vector<const char*> pointers;
        for (const auto& value : values)
            pointers.push_back(value.c_str());
        ippAddStrings(get(), IPP_TAG_PRINTER, tag, name, static_cast<int>(pointers.size()), nullptr,
                      pointers.data());
        return *this;
    }

    Description& numbers(ipp_tag_t tag, const char* name, const std::vector<int>& values) {
        removeAttribute(get(), name);
        ippAddIntegers(get(), IPP_TAG_PRINTER, tag, name, static_cast<int>(values.size()), values.data());
        return *this;
    }

    Description& collections(const char* name, const std::vector<IppPtr>& values) {
        removeAttribute(get(), name);
        std::vector<const ipp_t*> pointers;
        for (const auto& value : values)
            pointers.push_back(value.get());
        ippAddCollections(get(), IPP_TAG_PRINTER, name, static_cast<int>(pointers.size()), pointers.data());
        return *this;
    }

    IppPtr capabilities(PrinterService service = PrinterService::Print) const {
        return printerCapabilities(get(), service);
    }

private:
    IppPtr message_{ippNew()};
};

std::vector<std::string> texts(ipp_t* message, const char* name) {
    std::vector<std::string> values;
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_ZERO);
    for (int i = 0; attribute != nullptr && i < ippGetCount(attribute); ++i)
        values.emplace_back(ippGetString(attribute, i, nullptr));
    return values;
}

std::vector<int> numbers(ipp_t* message, const char* name) {
    std::vector<int> values;
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_ZERO);
    for (int i = 0; attribute != nullptr && i < ippGetCount(attribute); ++i)
        values.push_back(ippGetInteger(attribute, i));
    return values;
}

bool has(const IppPtr& message, const char* name) {
    return ippFindAttribute(message.get(), name, IPP_TAG_ZERO) != nullptr;
}

IppPtr size(int x, int y) {
    IppPtr collection{ippNew()};
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "x-dimension", x);
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "y-dimension", y);
    return collection;
}

IppPtr media(const IppPtr& mediaSize, const std::string& source, const std::string& type) {
    IppPtr collection{ippNew()};
    ippAddCollection(collection.get(), IPP_TAG_ZERO, "media-size", mediaSize.get());
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_KEYWORD, "media-source", nullptr, source.c_str());
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_KEYWORD, "media-type", nullptr, type.c_str());
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "media-top-margin", 300);
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_TEXT, "media-info", nullptr, "\"evil");
    return collection;
}

std::string ppdOf(const Description& description, PrinterService service = PrinterService::Print) {
    auto outcome = driverlessPPD(description.capabilities(service).get(), service);
    const auto* file = std::get_if<TemporaryFile>(&outcome);
    return file == nullptr ? std::string() : readFile(file->path());
}

TEST(HarmlessName, IsATextWithoutMeaningInAPpd) {
    for (const auto* name :
         {"tray-1", "com.acme.tray_2", "Tray 1", "B\xC3\xBCro", "iso_a4_210x297mm", "a+b, c & d"})
        EXPECT_TRUE(isHarmlessName(name)) << name;
    EXPECT_TRUE(isHarmlessName(std::string(255, 'a')));
}

TEST(HarmlessName, HasNothingOfPpdSyntaxOrPostScript) {
    for (const auto* name :
         {"",     "a\"b", "a/b",  "a:b",  "*a",   "a%b",      "(a",   "a)",  "<a",  "a>", "[a",  "{a", "a\\b",
          "a\nb", "a\rb", "a\tb", "\x7f", "\xFF", "\xC2\x85", "\xC3", "a^b", "a|b", "$a", "a;b", "`a`"})
        EXPECT_FALSE(isHarmlessName(name)) << name;
    EXPECT_FALSE(isHarmlessName(std::string(256, 'a')));
}

struct ModelCase {
    std::string text, model;
};
const ModelCase kModels[] = {
    {"Acme Laser 9000", "Acme Laser 9000"},
    {"  Acme \t Laser\n", "Acme Laser"},
    {"Acme \"Laser\" (big)", "Acme Laser big"},
    {"Acme\"\n*cupsFilter: \"x\"", "Acme cupsFilter x"},
    {"B\xC3\xBCro\xFF!", "B\xC3\xBCro !"},
    {"\"\"\"", ""},
    {"", ""},
    {std::string(79, 'a') + "\xC3\xBC", std::string(79, 'a')},
    {std::string(79, 'a') + " b", std::string(79, 'a')},
};

TEST(HarmlessModel, LosesWhatCouldEndAString) {
    for (const auto& [text, model] : kModels)
        EXPECT_EQ(harmlessModel(text), model) << text;
    EXPECT_EQ(harmlessModel(std::string(10'000, 'x')).size(), 80U);
}

TEST(PrinterCapabilities, KeepWhatADriverIsMadeFrom) {
    const auto capabilities = Description().capabilities();
    EXPECT_EQ(texts(capabilities.get(), "printer-make-and-model"), std::vector<std::string>{"Acme Scripted"});
    EXPECT_EQ(texts(capabilities.get(), "urf-supported"),
              (std::vector<std::string>{"V1.4", "CP1", "W8", "SRGB24", "RS600", "DM3"}));
    EXPECT_TRUE(has(capabilities, "printer-resolution-supported"));
    EXPECT_TRUE(has(capabilities, "color-supported"));
}

TEST(PrinterCapabilities, LeaveEverythingElseBehind) {
    Description description;
    description.text(IPP_TAG_URI, "printer-strings-uri", {"http://evil.example/strings"})
        .text(IPP_TAG_URI, "printer-icons", {"http://evil.example/icon.png"})
        .text(IPP_TAG_URI, "printer-more-info", {"http://evil.example/"})
        .text(IPP_TAG_KEYWORD, "ipp-features-supported", {"faxout"})
        .text(IPP_TAG_URI, "printer-uri-supported", {"ipp://h/ipp/faxout"})
        .text(IPP_TAG_KEYWORD, "acme-unknown", {"x"});
    const auto capabilities = description.capabilities();
    for (const auto* name :
         {"printer-strings-uri", "printer-icons", "printer-more-info", "ipp-features-supported",
          "printer-uri-supported", "acme-unknown", "printer-info", "printer-location", "printer-device-id"})
        EXPECT_FALSE(has(capabilities, name)) << name;
}

TEST(PrinterCapabilities, LoseBadValuesOneByOne) {
    Description description;
    description.text(IPP_TAG_KEYWORD, "media-source-supported", {"tray-1", "tray\"2", "tray-3"});
    EXPECT_EQ(texts(description.capabilities().get(), "media-source-supported"),
              (std::vector<std::string>{"tray-1", "tray-3"}));
}

TEST(PrinterCapabilities, LoseAnAttributeWithoutAGoodValue) {
    Description description;
    description.text(IPP_TAG_KEYWORD, "media-source-supported", {"tray\"1", ""})
        .numbers(IPP_TAG_ENUM, "print-quality-supported", {0, 2, 6, -1});
    EXPECT_FALSE(has(description.capabilities(), "media-source-supported"));
    EXPECT_FALSE(has(description.capabilities(), "print-quality-supported"));
}

TEST(PrinterCapabilities, LoseAttributesOfTheWrongKind) {
    Description description;
    description.text(IPP_TAG_URI, "media-source-supported", {"tray-1"})
        .text(IPP_TAG_KEYWORD, "print-quality-supported", {"4"})
        .text(IPP_TAG_KEYWORD, "printer-resolution-supported", {"600dpi"})
        .text(IPP_TAG_KEYWORD, "media-col-database", {"x"})
        .text(IPP_TAG_KEYWORD, "color-supported", {"true"})
        .numbers(IPP_TAG_INTEGER, "sides-supported", {1, 2})
        .numbers(IPP_TAG_INTEGER, "printer-make-and-model", {1});
    const auto capabilities = description.capabilities();
    for (const auto* name :
         {"media-source-supported", "print-quality-supported", "printer-resolution-supported",
          "media-col-database", "color-supported", "sides-supported", "printer-make-and-model"})
        EXPECT_FALSE(has(capabilities, name)) << name;
}

TEST(PrinterCapabilities, LoseUrfWithoutAResolution) {
    Description description;
    description.text(IPP_TAG_KEYWORD, "urf-supported", {"V1.4", "W8", "good"});
    EXPECT_FALSE(has(description.capabilities(), "urf-supported"));
}

TEST(PrinterCapabilities, BoundNumbers) {
    Description description;
    description.numbers(IPP_TAG_ENUM, "print-quality-supported", {3, 4, 5, 99})
        .numbers(IPP_TAG_INTEGER, "media-top-margin-supported", {0, -5, 423, 2'000'000'000});
    EXPECT_EQ(numbers(description.capabilities().get(), "print-quality-supported"),
              (std::vector<int>{3, 4, 5}));
    EXPECT_EQ(numbers(description.capabilities().get(), "media-top-margin-supported"),
              (std::vector<int>{0, 423}));
}

TEST(PrinterCapabilities, BoundResolutions) {
    Description description;
    removeAttribute(description.get(), "printer-resolution-supported");
    const int x[] = {600, 0, -1, 1'000'000, 300};
    const int y[] = {600, 600, 600, 600, 0};
    ippAddResolutions(description.get(), IPP_TAG_PRINTER, "printer-resolution-supported", 5, IPP_RES_PER_INCH,
                      x, y);
    auto capabilities = description.capabilities();
    auto* kept = ippFindAttribute(capabilities.get(), "printer-resolution-supported", IPP_TAG_RESOLUTION);
    ASSERT_NE(kept, nullptr);
    EXPECT_EQ(ippGetCount(kept), 1);
}

TEST(PrinterCapabilities, BoundTheNumberOfValues) {
    Description description;
    description.text(IPP_TAG_KEYWORD, "media-type-supported", std::vector<std::string>(5000, "stationery"));
    std::vector<IppPtr> sizes;
    for (int i = 0; i < 9000; ++i)
        sizes.push_back(size(20000 + i, 30000));
    description.collections("media-size-supported", sizes);
    const auto capabilities = description.capabilities();
    EXPECT_EQ(texts(capabilities.get(), "media-type-supported").size(), 256U);
    EXPECT_EQ(
        ippGetCount(ippFindAttribute(capabilities.get(), "media-size-supported", IPP_TAG_BEGIN_COLLECTION)),
        4096);
}

TEST(PrinterCapabilities, CopyMediaByTheirKnownMembers) {
    std::vector<IppPtr> database;
    database.push_back(media(size(21000, 29700), "tray-1", "stationery"));
    Description description;
    description.collections("media-col-database", database);
    const auto capabilities = description.capabilities();
    auto* attribute = ippFindAttribute(capabilities.get(), "media-col-database", IPP_TAG_BEGIN_COLLECTION);
    ASSERT_NE(attribute, nullptr);
    auto* copied = ippGetCollection(attribute, 0);
    EXPECT_EQ(texts(copied, "media-source"), std::vector<std::string>{"tray-1"});
    EXPECT_EQ(numbers(copied, "media-top-margin"), std::vector<int>{300});
    EXPECT_EQ(ippFindAttribute(copied, "media-info", IPP_TAG_ZERO), nullptr);
    auto* mediaSize = ippFindAttribute(copied, "media-size", IPP_TAG_BEGIN_COLLECTION);
    ASSERT_NE(mediaSize, nullptr);
    EXPECT_EQ(numbers(ippGetCollection(mediaSize, 0), "y-dimension"), std::vector<int>{29700});
}

TEST(PrinterCapabilities, LoseSizesWithoutTwoPlausibleSides) {
    std::vector<IppPtr> sizes;
    sizes.push_back(size(21000, 29700));
    sizes.push_back(size(0, 29700));
    sizes.push_back(size(21000, -1));
    sizes.push_back(size(2'000'000'000, 2'000'000'000));
    sizes.emplace_back(ippNew());
    Description description;
    description.collections("media-size-supported", sizes);
    const auto capabilities = description.capabilities();
    EXPECT_EQ(
        ippGetCount(ippFindAttribute(capabilities.get(), "media-size-supported", IPP_TAG_BEGIN_COLLECTION)),
        1);
}

TEST(PrinterCapabilities, KeepTheRangeOfACustomSize) {
    std::vector<IppPtr> sizes;
    sizes.emplace_back(ippNew());
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "x-dimension", 10000, 21590);
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "y-dimension", 14800, 35560);
    sizes.emplace_back(ippNew());
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "x-dimension", 21590, 10000);
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "y-dimension", 14800, 35560);
    Description description;
    description.collections("media-size-supported", sizes);
    const auto capabilities = description.capabilities();
    EXPECT_EQ(
        ippGetCount(ippFindAttribute(capabilities.get(), "media-size-supported", IPP_TAG_BEGIN_COLLECTION)),
        1);
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
    const TemporaryFolder folder;
    const PpdPtr ppd{ppdOpenFile(folder.write("x.ppd", ppdOf(description)).c_str())};
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
    EXPECT_FALSE(has(description.capabilities(), "media-size-supported"));
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
