#include "deviceid/PMDictionaryAdditions.h"

#include <gtest/gtest.h>

#include <string_view>
#include <vector>

#include "deviceid/PMStringAdditions.h"

namespace ventras::PMDictionaryAdditions {
namespace {

using Text = std::optional<std::string>;
using Description = DeviceDescription;

struct TextCase {
    Description description;
    Text expected;
};

struct FlagCase {
    Description description;
    bool expected;
};

void expectEach(const std::vector<TextCase>& cases, Text (*ask)(const Description&)) {
    for (const auto& [description, expected] : cases)
        EXPECT_EQ(ask(description), expected) << stringValue(description);
}

void expectEach(const std::vector<FlagCase>& cases, bool (*ask)(const Description&)) {
    for (const auto& [description, expected] : cases)
        EXPECT_EQ(ask(description), expected) << stringValue(description);
}

struct KeyCase {
    Text (*ask)(const Description&);
    std::string_view name;
    std::vector<std::string> keys;
};

const KeyCase kKeyCases[] = {
    {commandSet, "commandSet", {"CMD", "COMMAND SET", "usb_CMD", "usb_COMMAND SET", "pdl"}},
    {compatibleIDs, "compatibleIDs", {"CID", "COMPATIBLITY ID", "usb_CID", "usb_COMPATIBLITY ID"}},
    {make, "make", {"MFG", "MANUFACTURER", "MFR", "usb_MFG", "usb_MANUFACTURER"}},
    {model, "model", {"MDL", "MODEL", "usb_MDL", "usb_MODEL"}},
    {serialNumber, "serialNumber", {"SN", "SRN", "SERN", "usb_SN", "usb_SRN", "usb_SERN"}},
};

TEST(DescriptionKeys, AreAllReadAndTheEarlierInTheListWins) {
    for (const auto& [ask, name, keys] : kKeyCases)
        for (std::size_t first = 0; first < keys.size(); ++first) {
            EXPECT_EQ(ask({{keys[first], "value"}}), "value") << name << " " << keys[first];
            for (std::size_t second = first + 1; second < keys.size(); ++second)
                EXPECT_EQ(ask({{keys[second], "two"}, {keys[first], "one"}}), "one")
                    << name << " " << keys[first] << " " << keys[second];
        }
}

TEST(DescriptionKeys, AreExactAndMayHoldAnEmptyValue) {
    EXPECT_EQ(make({{"mfg", "HP"}}), std::nullopt);
    EXPECT_EQ(make({{"MFG:", "HP"}}), std::nullopt);
    EXPECT_EQ(make({{"usb_G", "HP"}}), std::nullopt);
    EXPECT_EQ(model({{"ty", "LaserJet"}}), std::nullopt);
    EXPECT_EQ(make({{"MFG", ""}, {"usb_MFG", "HP"}, {"product", "(HP X)"}}), "");
    EXPECT_EQ(commandSet({{"pdl", "application/pdf,image/urf"}}), "application/pdf,image/urf");
}

TEST(DescriptionMake, FallsBackOnTheProduct) {
    expectEach({{{{"product", "(HP LaserJet 4)"}}, "HP"},
                {{{"product", "(deskjet 5550)"}}, "hp"},
                {{{"product", "(LaserJet)"}}, std::nullopt},
                {{{"product", " X"}}, ""},
                {{{"product", ""}}, std::nullopt},
                {{}, std::nullopt}},
               make);
}

TEST(DescriptionModel, FallsBackOnTheProduct) {
    expectEach({{{{"product", "(HP LaserJet 4)"}}, "LaserJet 4"},
                {{{"product", "(deskjet 5550)"}}, "deskjet 5550)"},
                {{{"product", "(LaserJet)"}}, std::nullopt},
                {{{"product", "(HP "}}, ""},
                {{{"product", ""}}, std::nullopt},
                {{}, std::nullopt}},
               model);
}

TEST(DescriptionProduct, HasTheMakersNameOnceAndShort) {
    expectEach({{{{"usb_MFG", "HP"}, {"usb_MDL", "HP LaserJet"}}, "(HP LaserJet)"},
                {{{"product", "(Lexmark International Lexmark E120)"}, {"MFG", "x"}}, "(Lexmark E120)"},
                {{{"product", ""}, {"MFG", "HP"}, {"MDL", "X"}}, ""},
                {{{"MFG", "HP"}}, ""},
                {{}, ""}},
               [](const Description& description) { return Text{product(description)}; });
}

TEST(DescriptionScanID, NamesMakeAndModelOnce) {
    expectEach({{{{"usb_MFG", "HP"}, {"usb_MDL", "HP LaserJet"}}, "MANUFACTURER:HP;MODEL:LaserJet"},
                {{{"MFG", " HP "}, {"MDL", "X\t"}}, "MANUFACTURER:HP;MODEL:X"},
                {{{"MFG", "HP"}}, std::nullopt},
                {{{"MDL", "HP"}}, std::nullopt}},
               softwareUpdateScaneID);
}

TEST(DescriptionSupportsPostscript, WantsTheWordOrNothingElse) {
    expectEach({{{}, true},
                {{{"pdl", "application/pdf,image/urf"}}, false},
                {{{"pdl", "application/pdf,application/PostScript"}}, true},
                {{{"CMD", "PS"}}, true},
                {{{"CMD", "PCL;PS;PJL"}}, true},  // a TXT value may hold what separates components
                {{{"CMD", "PCL,PS,PJL"}}, false},
                {{{"CMD", "PCL, PS , PJL"}}, true},
                {{{"CMD", ""}}, false}},
               supportsPostscript);
}

TEST(DescriptionSupportsPCL, WantsTheLettersAnywhere) {
    expectEach({{{}, false}, {{{"pdl", "application/vnd.hp-PCL"}}, true}, {{{"CMD", "PJL"}}, false}},
               supportsPCL);
}

TEST(DescriptionSupportsScanning, IsDeniedOnlyByBothKeys) {
    expectEach({{{}, true},
                {{{"scan", "T"}}, true},
                {{{"scan", "t"}, {"Scan", "F"}}, true},
                {{{"scan", "F"}}, true},
                {{{"Scan", "F"}}, true},
                {{{"scan", "F"}, {"Scan", "T"}}, true},
                {{{"scan", ""}, {"Scan", ""}}, false},
                {{{"scan", "F"}, {"Scan", "F"}}, false}},
               supportsScanning);
}

TEST(StringValue, JoinsKeysAndValuesInKeyOrder) {
    EXPECT_EQ(stringValue({}), "");
    EXPECT_EQ(stringValue({{"MFG", "HP"}}), "MFG:HP");
    EXPECT_EQ(stringValue({{"usb_MFG", "HP"}, {"MDL", "X"}, {"", ""}}), ":;MDL:X;usb_MFG:HP");
}

TEST(StringValue, IsReadAsADeviceID) {
    const auto deviceID = stringValue({{"usb_MFG", "HP"}, {"usb_MDL", "LaserJet"}, {"pdl", "image/urf"}});
    EXPECT_EQ(PMStringAdditions::make(deviceID), "HP");
    EXPECT_EQ(PMStringAdditions::model(deviceID), "LaserJet");
    EXPECT_EQ(PMStringAdditions::commandSet(deviceID), "image/urf");
}

}  // namespace
}  // namespace ventras::PMDictionaryAdditions
