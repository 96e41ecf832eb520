#include "deviceid/PMStringAdditions.h"

#include <gtest/gtest.h>

#include <array>

namespace ventras::PMStringAdditions {
namespace {

using Text = std::optional<std::string>;
using namespace std::string_view_literals;

constexpr std::optional<std::string_view> kNone;

struct TextCase {
    std::string_view deviceID;
    std::optional<std::string_view> expected;
};

struct FlagCase {
    std::string_view deviceID;
    bool expected;
};

template <std::size_t N>
void expectEach(const TextCase (&cases)[N], Text (*ask)(std::string_view)) {
    for (const auto& [deviceID, expected] : cases)
        EXPECT_EQ(ask(deviceID), Text{expected}) << "device ID: '" << deviceID << "'";
}

template <std::size_t N>
void expectEach(const TextCase (&cases)[N], std::string (*ask)(std::string_view)) {
    for (const auto& [deviceID, expected] : cases)
        EXPECT_EQ(ask(deviceID), *expected) << "device ID: '" << deviceID << "'";
}

template <std::size_t N>
void expectEach(const FlagCase (&cases)[N], bool (*ask)(std::string_view)) {
    for (const auto& [deviceID, expected] : cases)
        EXPECT_EQ(ask(deviceID), expected) << "device ID: '" << deviceID << "'";
}

TEST(SearchString, FindsAKeyIgnoringCaseAndBehindWhiteSpaceOnly) {
    constexpr TextCase kCases[] = {
        {"MFG:HP", "HP"},
        {"mfg:Canon", "Canon"},
        {"mFg:Canon", "Canon"},
        {"  MFG:Canon", "Canon"},
        {"\t MFG:Canon", "Canon"},
        {"XMFG:Canon", kNone},
        {"X MFG:Canon", kNone},
        {"XMFG:a MFG:b", kNone},  // only the first place counts
        {"MFG :Canon", kNone},
        {"MF", kNone},
        {"MFG", kNone},
    };
    expectEach(kCases, [](std::string_view id) { return stringForKey(id, "MFG:"); });
}

TEST(SearchString, GivesTheValueAsItStands) {
    constexpr TextCase kCases[] = {
        {"MFG: HP ", " HP "}, {"MFG:hP", "hP"},     {"MFG:MFG:HP", "MFG:HP"},
        {"MFG:a:b", "a:b"},   {"MFG:a\nb", "a\nb"}, {"MFG:\xC3\xA9\xFF", "\xC3\xA9\xFF"},
        {"MFG:;MDL:x", ""},   {"  MFG:", ""},       {"MFG:"sv, ""},
    };
    expectEach(kCases, [](std::string_view id) { return stringForKey(id, "MFG:"); });
}

TEST(SearchString, TakesTheFirstComponentThatMatchesAnyKey) {
    constexpr std::array kKeys{"A:"sv, "B:"sv};
    EXPECT_EQ(searchStringFor("B:2;A:1", kKeys), "2");
    EXPECT_EQ(searchStringFor("A:1;B:2", kKeys), "1");
    EXPECT_EQ(searchStringFor("x;;B:2;A:1", kKeys), "2");
    EXPECT_EQ(searchStringFor("A:1;A:2", kKeys), "1");
}

TEST(SearchString, LetsTheOrderOfKeysDecideWithinAComponent) {
    constexpr std::array kShortFirst{"DES"sv, "DESCRIPTION"sv};
    constexpr std::array kLongFirst{"DESCRIPTION"sv, "DES"sv};
    EXPECT_EQ(searchStringFor("DESCRIPTION:x", kShortFirst), "CRIPTION:x");
    EXPECT_EQ(searchStringFor("DESCRIPTION:x", kLongFirst), ":x");
}

TEST(SearchString, GivesNothingForNothing) {
    EXPECT_EQ(searchStringFor("MFG:HP", {}), std::nullopt);
    EXPECT_EQ(stringForKey("", "MFG:"), std::nullopt);
    EXPECT_EQ(stringForKey("MFG:HP", ""), std::nullopt);
    EXPECT_EQ(stringForKey(";;;", "MFG:"), std::nullopt);
    EXPECT_EQ(stringForKey("   ;  ", "MFG:"), std::nullopt);
}

struct KeyCase {
    Text (*ask)(std::string_view);
    std::string_view name;
    std::vector<std::string_view> spellings;
};

const KeyCase kKeyCases[] = {
    {commandSet, "commandSet", {"CMD:", "COMMAND SET:", "usb_CMD:", "usb_COMMAND SET:", "pdl:"}},
    {compatibleIDs, "compatibleIDs", {"CID:", "COMPATIBLITY ID:", "usb_CID:", "usb_COMPATIBLITY ID:"}},
    {make, "make", {"MFR:", "MFG:", "MANUFACTURER:", "usb_MFG:", "usb_MANUFACTURER:", "usb_G:"}},
    {model, "model", {"MDL:", "MODEL:", "usb_MDL:", "usb_MODEL:"}},
    {serialNumber, "serialNumber", {"SN:", "SRN:", "SERN:", "usb_SN:", "usb_SRN:", "usb_SERN:"}},
};

TEST(DeviceIDKeys, AreAllReadAndTheFirstComponentWins) {
    for (const auto& [ask, name, spellings] : kKeyCases)
        for (const auto first : spellings) {
            const std::string firstText(first);
            EXPECT_EQ(ask("x:y;" + firstText + "value;z:"), "value") << name << " " << first;
            for (const auto second : spellings)
                EXPECT_EQ(ask(firstText + "one;" + std::string(second) + "two"), "one")
                    << name << " " << first << " " << second;
        }
}

TEST(DeviceIDKeys, HaveNoOtherSpelling) {
    EXPECT_EQ(compatibleIDs("COMPATIBILITY ID:x"), std::nullopt);
    EXPECT_EQ(serialNumber("SERIALNUMBER:x;SER:y"), std::nullopt);
    EXPECT_EQ(commandSet("COMMANDSET:x"), std::nullopt);
    EXPECT_EQ(make("usb_MFR:HP"), std::nullopt);
}

TEST(DeviceIDMake, FallsBackOnTheProductOnlyWithoutAKey) {
    constexpr TextCase kCases[] = {
        {"MFG:HP;MDL:LaserJet 4;", "HP"},
        {"MFG:", ""},
        {"MFG:;product:(HP LaserJet 4)", ""},
        {"product:(HP LaserJet 4)", "HP"},
        {"product:(Some One Else)", "Some"},
        {"product:(deskjet 990c)", "hp"},
        {"product:(deskjet", "hp"},
        {"product:(DeskJet 990c)", "DeskJet"},
        {"product:(LaserJet)", kNone},
        {"product:", kNone},
        {"product: (HP X)", ""},
        {"product: ", ""},
        {"product:\xC3\xA9ta X", "ta"},  // the first character, not the first byte
        {"ty:HP LaserJet", kNone},
        {"", kNone},
    };
    expectEach(kCases, make);
}

TEST(DeviceIDModel, FallsBackOnTheTypeThenOnTheProduct) {
    constexpr TextCase kCases[] = {
        {"MFG:HP;MDL:LaserJet 4;", "LaserJet 4"},
        {"ty:T;MDL:M", "M"},
        {"product:(HP P);ty:T", "T"},
        {"ty:;product:(HP P)", ""},
        {"pty:x;product:(HP P)", "P"},
        {"product:(HP LaserJet 4)", "LaserJet 4"},
        {"product:(deskjet 990c)", "deskjet 990c)"},
        {"product:(deskjet", "deskjet"},
        {"product:(LaserJet)", kNone},
        {"product:(HP ", ""},
        {"product:(HP X", ""},
        {"product:", kNone},
        {"product:(HP Caf\xC3\xA9", "Caf"},  // the last character, not the last byte
        {"", kNone},
    };
    expectEach(kCases, model);
}

TEST(DeviceIDProduct, HasTheMakersNameOnceAndShort) {
    constexpr TextCase kCases[] = {
        {"MFG:HP;MDL:LaserJet 4;", "(HP LaserJet 4)"},
        {"product:(Brother HL);MFG:HP;MDL:X", "(Brother HL)"},
        {"product:;MFG:HP;MDL:X", ""},
        {"MFG:HP;MDL:HP LaserJet", "(HP LaserJet)"},
        {"MFG:Hewlett-Packard;MDL:HP LaserJet", "(HP LaserJet)"},
        {"MFG:Hewlett-Packard;MDL:LaserJet", "(HP LaserJet)"},
        {"product:(hewlett-packard LaserJet)", "(HP LaserJet)"},
        {"MFG:Lexmark International;MDL:Lexmark E120", "(Lexmark E120)"},
        {"MFG:Lexmark International;MDL:E120", "(Lexmark E120)"},
        {"MFG:Lexmark;MDL:Lexmark E120", "(Lexmark E120)"},
        {"MFG:LEXMARK;MDL:LEXMARK E120", "(Lexmark E120)"},
        {"product:(HP HP HP X)", "(HP HP X)"},  // at most one of each group
        {"product:(HP HP X) (Lexmark Lexmark Y)", "(HP X) (Lexmark Y)"},
        {"product:(Hewlett-Packard A) (Hewlett-Packard HP B)", "(Hewlett-Packard A) (HP B)"},
        {"product:(Hewlett-Packard A) (Hewlett-Packard B)", "(HP A) (Hewlett-Packard B)"},
        {"product:Hewlett-Packard HP X", "Hewlett-Packard HP X"},
        {"MFG:HP", ""},
        {"MDL:X", ""},
        {"MFG: HP;MDL:X ", "( HP X )"},
        {"", ""},
    };
    expectEach(kCases, product);
}

TEST(DeviceName, PutsTheMakeInFrontUnlessTheModelHasIt) {
    constexpr TextCase kCases[] = {
        {"MFG:HP;MDL:LaserJet 4;", "HP LaserJet 4"},
        {"MDL:HP LaserJet 4;MFG:HP", "HP LaserJet 4"},
        {"MFG:hp;MDL:HP LaserJet", "HP LaserJet"},  // case-sensitive, and then the first group of rewrites
        {"MFG:canon;MDL:Canon X", "canon Canon X"},
        {"MFG: Canon ;MDL: X ", "Canon X"},
        {"MFG:;MDL:X500", " X500"},  // an empty make is no prefix
        {"MFG:Canon;MDL:", "Canon "},
        {"product:(deskjet 990c)", "hp deskjet 990c)"},
    };
    expectEach(kCases, deviceName);
}

TEST(DeviceName, HasTheMakersNameOnceAndShort) {
    constexpr TextCase kCases[] = {
        {"MANUFACTURER:Hewlett-Packard;MODEL:HP LaserJet", "HP LaserJet"},
        {"MFG:Hewlett-Packard;MDL:LaserJet", "HP LaserJet"},
        {"MFG:HEWLETT-PACKARD;MDL:LaserJet", "HP LaserJet"},
        {"MFG:Hewlett-Packard;MDL:Hewlett-Packard X", "HP X"},
        {"MFG:Lexmark International;MDL:Lexmark E120", "Lexmark E120"},
        {"MFG:Lexmark International;MDL:E120", "Lexmark E120"},
        {"MFG:Lexmark;MDL:Lexmark Lexmark E120", "Lexmark E120"},
        {"MDL:HP HP X", "HP HP X"},  // a model alone is not touched
    };
    expectEach(kCases, deviceName);
}

TEST(DeviceName, MakesDoWithWhatThereIs) {
    constexpr TextCase kCases[] = {
        {"MDL: LaserJet ", "LaserJet"},
        {"MFG: HP ", "HP"},
        {"MDL:", ""},
        {"DES:LaserJet", ":LaserJet"},
        {"DESCRIPTION:LaserJet", "CRIPTION:LaserJet"},
        {"DES", ""},
        {"MDL:X;DES:LaserJet", "X"},
        {"", "Unknown"},
        {";;", "Unknown"},
        {"CMD:PCL", "Unknown"},
    };
    expectEach(kCases, deviceName);
}

TEST(SoftwareUpdateScanID, NamesMakeAndModelOnce) {
    constexpr TextCase kCases[] = {
        {"MFG:HP;MDL:LaserJet 4;", "MANUFACTURER:HP;MODEL:LaserJet 4"},
        {"MDL:HP LaserJet 4;MFG:HP", "MANUFACTURER:HP;MODEL:LaserJet 4"},
        {"MFG:HP;MDL:HPLaserJet", "MANUFACTURER:HP;MODEL:HPLaserJet"},
        {"MFG:HP;MDL:hp LaserJet", "MANUFACTURER:HP;MODEL:hp LaserJet"},
        {"MFG:HP;MDL:HP", "MANUFACTURER:HP;MODEL:HP"},
        {"MFG:HP;MDL:HP  X", "MANUFACTURER:HP;MODEL: X"},
        {"MFG: HP ;MDL:\tX\t", "MANUFACTURER:HP;MODEL:X"},
        {"MFG:;MDL:X500", "MANUFACTURER:;MODEL:X500"},
        {"MFG:;MDL: X500", "MANUFACTURER:;MODEL:X500"},
        {"MFG:HP", kNone},
        {"MDL:X", kNone},
        {"", kNone},
    };
    expectEach(kCases, softwareUpdateScaneID);
}

using Pairs = DeviceDescription;

TEST(DictionaryValue, HoldsEveryComponent) {
    EXPECT_EQ(dictionaryValue("a:1;;B: 2 "), (Pairs{{"a", "1"}, {"", ""}, {"b", "2"}}));
    EXPECT_EQ(dictionaryValue("MFG:HP;MDL:x;"), (Pairs{{"mfg", "HP"}, {"mdl", "x"}, {"", ""}}));
    EXPECT_EQ(dictionaryValue("A:1;a:2"), (Pairs{{"a", "2"}}));
    EXPECT_EQ(dictionaryValue(" Key \r\n:\tvalue\n"), (Pairs{{"key", "value"}}));
    EXPECT_EQ(dictionaryValue("\n Flag \n"), (Pairs{{"flag", ""}}));
    EXPECT_EQ(dictionaryValue("a:b:c"), (Pairs{{"a", "b:c"}}));
    EXPECT_EQ(dictionaryValue(":v"), (Pairs{{"", "v"}}));
    EXPECT_EQ(dictionaryValue(""), std::nullopt);
}

TEST(DictionaryValue, TakesOtherSeparators) {
    EXPECT_EQ(dictionaryValueForKeySeperator("A=1&b=x:y", "=", "&"), (Pairs{{"a", "1"}, {"b", "x:y"}}));
    EXPECT_EQ(dictionaryValueForKeySeperator("A=1, b=2", "=", ", "), (Pairs{{"a", "1"}, {"b", "2"}}));
    EXPECT_EQ(dictionaryValueForKeySeperator("A=1;b", "=", ""), (Pairs{{"a", "1;b"}}));
    EXPECT_EQ(dictionaryValueForKeySeperator("A=1;b", "", ";"), (Pairs{{"a=1", ""}, {"b", ""}}));
    EXPECT_EQ(dictionaryValueForKeySeperator("AxB", "X", ";"), (Pairs{{"axb", ""}}));
}

TEST(DictionaryValue, LeavesOutComponentsWithALongKeySeparator) {
    EXPECT_EQ(dictionaryValueForKeySeperator("a::1;b;c::", "::", ";"), (Pairs{{"b", ""}}));
    EXPECT_EQ(dictionaryValueForKeySeperator("a\xC2\xB7"  // one character of two bytes
                                             "1",
                                             "\xC2\xB7", ";"),
              (Pairs{{"a", "1"}}));
}

TEST(SupportsPostscript, WantsTheWordOrNothingElse) {
    constexpr FlagCase kCases[] = {
        {"MFG:HP", true},  // no command set at all
        {"", true},
        {"CMD:PostScript", true},
        {"CMD:PCL,POSTSCRIPT3", true},
        {"CMD:PCL,PS", false},
        {"CMD:PCL,PS,PJL", false},
        {"CMD:PS", true},
        {"CMD:ps", true},
        {"CMD: PS", false},
        {"CMD:PCL, PS , PJL", true},
        {"CMD:PCL PS PJL", true},
        {"CMD:", false},
        {"CMD:;PS", false},
        {"pdl:application/postscript", true},
    };
    expectEach(kCases, supportsPostscript);
}

TEST(SupportsPCL, WantsTheLettersAnywhere) {
    constexpr FlagCase kCases[] = {
        {"CMD:PCL,PS", true},    {"CMD:pclxl", true}, {"CMD:xPcLx", true}, {"CMD:PC L", false},
        {"CMD:;MDL:PCL", false}, {"MDL:PCL", false},  {"", false},
    };
    expectEach(kCases, supportsPCL);
}

TEST(SupportsScanning, TakesSilenceForAYes) {
    constexpr FlagCase kCases[] = {
        {"", true},        {"MFG:HP", true}, {"scan:T", true},   {"SCAN:t", true},         {"Scan:T", true},
        {"SCAN:F", false}, {"SCAN", false},  {"scan:", false},   {"scan: T", false},       {"scan:TT", false},
        {"scanT", true},   {"scanF", false}, {"scanner", false}, {"scan:F;Scan:T", false},
    };
    expectEach(kCases, supportsScanning);
}

TEST(PercentEscapes, CoverAllThatHasAMeaningInAURL) {
    const auto escaped = [](std::string_view text) {
        return pmStringByAddingPercentEscapesUsingEncoding(text, "UTF-8");
    };
    EXPECT_EQ(escaped("@?&+,;=/():\\"), "%40%3F%26%2B%2C%3B%3D%2F%28%29%3A%5C");
    EXPECT_EQ(escaped(" %#<>\"{}|^`[]\x7F\n"), "%20%25%23%3C%3E%22%7B%7D%7C%5E%60%5B%5D%7F%0A");
    EXPECT_EQ(escaped("AZaz09-._~!$'*"), "AZaz09-._~!$'*");
    EXPECT_EQ(escaped("\xC3\xA9"), "%C3%A9");
    EXPECT_EQ(escaped("\xFF\0"sv), "%FF%00");
    EXPECT_EQ(escaped(""), "");
}

TEST(PercentEscapes, AreThoseOfTheEncodingAsked) {
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding("\xC3\xA9 x", "ISO-8859-1"), "%E9%20x");
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding("\xE3\x82\xA2", "SHIFT_JIS"), "%83A");
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding({}, "ISO-8859-1"), "");
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding("\xE3\x82\xA2", "ISO-8859-1"), std::nullopt);
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding("\xFF", "ISO-8859-1"), std::nullopt);
    EXPECT_EQ(pmStringByAddingPercentEscapesUsingEncoding("x", "no such encoding"), std::nullopt);
}

}  // namespace
}  // namespace ventras::PMStringAdditions
