#include "platform/linux/installer/InstallQuestion.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/installer/PackageID.h"

namespace ventras {
namespace {

struct TextCase {
    std::string text, plain;
};
const TextCase kTexts[] = {
    {"plain", "plain"},
    {"", ""},
    {"Café <b> & %s", "Café <b> & %s"},
    {"two\nlines", "two\\x0Alines"},
    {"\x1B[2J\x07", "\\x1B[2J\\x07"},
    {"broken \xFF", "broken \\xFF"},
    {std::string(200, 'x'), std::string(200, 'x')},
    {std::string(201, 'x'), std::string(200, 'x') + "…"},
    {std::string(1'000'000, 'x'), std::string(200, 'x') + "…"},
    {std::string(199, 'x') + "é", std::string(199, 'x') + "…"},
};

TEST(PromptText, IsOneLineThatCanBeShown) {
    for (const auto& [text, plain] : kTexts)
        EXPECT_EQ(plainText(text), plain) << text.substr(0, 300);
}

TEST(PromptText, OfALicenceKeepsItsLines) {
    EXPECT_EQ(plainLines("one\n\ntwo\x1B\n"), "one\n\ntwo\\x1B");
    EXPECT_EQ(plainLines(""), "");
    std::string many;
    for (int i = 0; i < 1000; ++i)
        many += "line\n";
    EXPECT_TRUE(plainLines(many).ends_with("line\n…"));
    EXPECT_LT(plainLines(many).size(), 1000U);
}

TEST(PromptText, ListsPackagesAndDevices) {
    EXPECT_EQ(
        offerText({{"a-driver", "1.0", "Driver A"}, {"b-driver", "2:3-4", "Driver\nB"}}, {"Laser", "Ink"}),
        "Driver A (a-driver 1.0)\nDriver\\x0AB (b-driver 2:3-4)\nLaser\nInk");
    EXPECT_EQ(offerText({}, {}), "");
}

TEST(PromptText, ListsNoEndlessLists) {
    const auto text = offerText(std::vector<OfferedPackage>(1000, {"driver", "1", "Driver"}),
                                std::vector<std::string>(1000, "Laser"));
    EXPECT_EQ(std::ranges::count(text, '\n'), 17);
    EXPECT_NE(text.find("…"), std::string::npos);
}

TEST(Markup, StandsForItself) {
    EXPECT_EQ(escapeMarkup("<a href='x'>&amp;</a>"), "&lt;a href='x'&gt;&amp;amp;&lt;/a&gt;");
    EXPECT_EQ(escapeMarkup(""), "");
}

struct IDCase {
    std::string text;
    bool isGood;
};
const IDCase kIDs[] = {
    {"laser-driver;1.0;all;repository", true},
    {"laser-driver;2:1.0~rc1-1;amd64;", true},
    {"a;;;", true},
    {"", false},
    {";1.0;all;x", false},
    {"laser-driver", false},
    {"laser-driver;1.0;all", false},
    {"laser-driver;1.0;all;x;y", false},
    {"laser\ndriver;1.0;all;x", false},
    {"laser\xFF;1.0;all;x", false},
    {"laser;1.0;all;\x1B", false},
    {std::string(1021, 'x') + ";;;", true},
    {std::string(1022, 'x') + ";;;", false},
};

TEST(PackageID, HasFourFieldsAndANameAndNothingThatDoesHarm) {
    for (const auto& [text, isGood] : kIDs)
        EXPECT_EQ(PackageID::parse(text).has_value(), isGood) << testing::PrintToString(text.substr(0, 100));
    const auto id = PackageID::parse("laser-driver;2:1.0;all;repository").value();
    EXPECT_EQ(id.name, "laser-driver");
    EXPECT_EQ(id.version, "2:1.0");
    EXPECT_EQ(id.text, "laser-driver;2:1.0;all;repository");
    EXPECT_EQ(id.asInstalled(), "laser-driver;2:1.0;all;installed");
}

}  // namespace
}  // namespace ventras
