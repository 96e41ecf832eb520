#include "platform/linux/options/PrinterCapabilities.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/options/CapabilityText.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/platform-linux/PrinterDescription.h"

namespace ventras {
namespace {

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

int sizesKept(const std::vector<IppPtr>& sizes) {
    Description description;
    description.collections("media-size-supported", sizes);
    const auto capabilities = description.capabilities();
    return ippGetCount(
        ippFindAttribute(capabilities.get(), "media-size-supported", IPP_TAG_BEGIN_COLLECTION));
}

TEST(PrinterCapabilities, LoseSizesWithoutTwoPlausibleSides) {
    std::vector<IppPtr> sizes;
    sizes.push_back(size(21000, 29700));
    sizes.push_back(size(0, 29700));
    sizes.push_back(size(21000, -1));
    sizes.push_back(size(2'000'000'000, 2'000'000'000));
    sizes.emplace_back(ippNew());
    EXPECT_EQ(sizesKept(sizes), 1);
}

TEST(PrinterCapabilities, KeepTheRangeOfACustomSize) {
    std::vector<IppPtr> sizes;
    sizes.emplace_back(ippNew());
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "x-dimension", 10000, 21590);
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "y-dimension", 14800, 35560);
    sizes.emplace_back(ippNew());
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "x-dimension", 21590, 10000);
    ippAddRange(sizes.back().get(), IPP_TAG_ZERO, "y-dimension", 14800, 35560);
    EXPECT_EQ(sizesKept(sizes), 1);
}

}  // namespace
}  // namespace ventras
