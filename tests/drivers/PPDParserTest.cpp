#include "drivers/PPDParser.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

#include "drivers/PPDManager.h"
#include "tests/drivers/PPDText.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Lines = std::vector<std::string>;

class PPDFile : public testing::Test {
protected:
    std::string write(const Lines& lines) const { return folder_.write("a.ppd", ppdText(lines)); }

    PPDRecord parsed(const Lines& lines) const {
        const auto record = PPDManager::parsePPD(write(lines));
        EXPECT_TRUE(record) << ppdText(lines);
        return record.value_or(PPDRecord{});
    }

    TemporaryFolder folder_;
};

TEST_F(PPDFile, GivesARecordOfDefaultsWhenItSaysNothing) {
    const auto path = write({"*FormatVersion: \"4.3\""});
    PPDRecord expected;
    expected.name = path;
    expected.make = "UNKNOWN";
    expected.makeAndModel = path;
    expected.deviceID = "";
    expected.languageLevel = 0;
    expected.color = false;
    expected.throughput = 0;
    EXPECT_EQ(dictionaryFromRecord(*PPDManager::parsePPD(path)), dictionaryFromRecord(expected));
}

TEST_F(PPDFile, GivesEveryFieldThatItHasAKeywordFor) {
    const auto path = write({
        "*FileVersion: \"1.7\"",
        "*LanguageVersion: English",
        "*LanguageLevel: \"3\"",
        "*ColorDevice: True",
        "*Throughput: \"12\"",
        "*Manufacturer: \"Acme\"",
        "*ModelName: \"Acme Jet\"",
        "*ShortNickName: \"Jet\"",
        "*NickName: \"Acme Jet Foo\"",
        "*Product: \"(Jet)\"",
        "*1284DeviceID: \"MFG:Acme;MDL:Jet 5;\"",
        "*cupsModelNumber: 77",
        "*cupsFax: True",
        "*QLPrinterIconPath: \"/icons/jet.icns\"",
        "*QLPrinterLowInkTool: \"/tools/ink\"",
        "*cupsLanguages: \"en de\"",
        "*cupsCommands: \"Clean PrintSelfTestPage\"",
        "*PSVersion: \"(3010) 1\"",
        "*PSVersion: \"(3010) 2\"",
        "*cupsFilter: \"application/vnd.cups-raster 0 jet\"",
        "*QLDialogExtension: \"/plugins/a.plugin\"",
        "*QLDialogExtension: \"/plugins/b.plugin\"",
    });
    PPDRecord expected;
    expected.name = path;
    expected.make = "Acme";
    expected.makeAndModel = "Acme Jet Foo";
    expected.product = {"(Jet)", "Acme Jet", "Jet", "(Acme Jet 5)", "77"};
    expected.deviceID = "MFG:Acme;MDL:Jet 5;";
    expected.modelNumber = "77";
    expected.type = "fax";
    expected.filters = {"application/vnd.cups-raster 0 jet"};
    expected.naturalLanguage = Lines{"en", "de"};
    expected.languageLevel = 3;
    expected.color = true;
    expected.throughput = 12;
    expected.fileVersion = "1.7";
    expected.languageVersion = "English";
    expected.iconPath = "/icons/jet.icns";
    expected.inkTool = "/tools/ink";
    expected.cupsCommands = "Clean PrintSelfTestPage";
    expected.psVersion = {"(3010) 1", "(3010) 2"};
    expected.pdes = {"/plugins/a.plugin", "/plugins/b.plugin"};
    EXPECT_EQ(PPDManager::parsePPD(path), expected);
}

TEST_F(PPDFile, IsNothingWhenLibcupsCannotOpenItAsAPPD) {
    EXPECT_EQ(PPDManager::parsePPD("/nonexistent.ppd"), std::nullopt);
    EXPECT_EQ(PPDManager::parsePPD(folder_.path()), std::nullopt);
    EXPECT_EQ(PPDManager::parsePPD(folder_.write("empty", "")), std::nullopt);
    EXPECT_EQ(PPDManager::parsePPD(folder_.write("text", "hello\n")), std::nullopt);
    EXPECT_EQ(PPDManager::parsePPD(folder_.write("old", "*PPD-Adobe: \"3.0\"\n*ModelName: \"a\"\n")),
              std::nullopt);
}

TEST_F(PPDFile, IsReadWhenCompressed) {
    const auto path = writeCompressed(folder_, "a.ppd.gz", ppdText({"*ModelName: \"Acme Jet\""}));
    EXPECT_EQ(PPDManager::parsePPD(path).value().makeAndModel, "Acme Jet");
}

TEST_F(PPDFile, IsAFaxOnlyByYesOrTrue) {
    for (const auto* value : {"True", "true", "TRUE", "yes", "YES", "\"Yes\""})
        EXPECT_EQ(parsed({std::string("*cupsFax: ") + value}).type, "fax") << value;
    for (const auto* value : {"no", "1", "False", "\"true \"", "\"\""})
        EXPECT_EQ(parsed({std::string("*cupsFax: ") + value}).type, std::nullopt) << value;
}

TEST_F(PPDFile, IsNamedByTheFirstNameThatDecodes) {
    const std::string nick = "*NickName: \"A Nick\"", model = "*ModelName: \"B Model\"",
                      shortNick = "*ShortNickName: \"C\"";
    EXPECT_EQ(parsed({shortNick, model, nick}).makeAndModel, "A Nick");
    EXPECT_EQ(parsed({shortNick, model}).makeAndModel, "B Model");
    EXPECT_EQ(parsed({shortNick}).makeAndModel, "C");
    EXPECT_EQ(parsed({"*NickName: \"\xff\"", shortNick}).makeAndModel, "C");
    EXPECT_EQ(parsed({"*NickName: \"\"", shortNick}).makeAndModel, "");
}

TEST_F(PPDFile, TakesTheMakeFromTheModelNameWithoutAManufacturer) {
    EXPECT_EQ(parsed({"*Manufacturer: \"Foo\"", "*ModelName: \"Acme Jet\""}).make, "Foo");
    EXPECT_EQ(parsed({"*ModelName: \"Acme Jet 5\""}).make, "Acme");
    EXPECT_EQ(parsed({"*ModelName: \" Jet\""}).make, "");
    EXPECT_EQ(parsed({"*ModelName: \"Jet\""}).make, "UNKNOWN");
    EXPECT_EQ(parsed({"*NickName: \"Acme Jet\""}).make, "UNKNOWN");
    EXPECT_EQ(parsed({"*Manufacturer: \"\xff\"", "*ModelName: \"Acme \xff\""}).make, "Acme");
}

TEST_F(PPDFile, WithOnlyAModelNameIsMadeOfThat) {
    const auto record = parsed({"*ModelName: \"Acme Color Jet\""});
    EXPECT_EQ(record.make, "Acme");
    EXPECT_EQ(record.makeAndModel, "Acme Color Jet");
    EXPECT_THAT(record.product, ElementsAre("Acme Color Jet"));
}

TEST_F(PPDFile, SplitsItsLanguagesAtEverySpace) {
    EXPECT_EQ(parsed({"*cupsLanguages: \"en  de\""}).naturalLanguage, (Lines{"en", "", "de"}));
    EXPECT_EQ(parsed({"*cupsLanguages: \"\""}).naturalLanguage, Lines{""});
    EXPECT_EQ(parsed({}).naturalLanguage, std::nullopt);
}

TEST_F(PPDFile, GivesItsFiltersLastFirst) {
    const Lines filters{"*cupsFilter: \"a/a 0 A\"", "*cupsFilter: \"b/b 10 B\"", "*cupsFilter: \"c/c 20 C\""};
    EXPECT_THAT(parsed(filters).filters, ElementsAre("c/c 20 C", "b/b 10 B", "a/a 0 A"));
}

TEST_F(PPDFile, GivesItsFiltersAsLibcupsReportsThem) {
    // The newer form of the keyword replaces the older one and loses its destination type.
    EXPECT_THAT(parsed({"*cupsFilter: \"a/a 0 A\"", "*cupsFilter2: \"b/b c/c 0 B\""}).filters,
                ElementsAre("b/b 0 B"));
}

TEST_F(PPDFile, KeepsRepeatedProducts) {
    EXPECT_THAT(parsed({"*Product: \"(B)\"", "*Product: \"(A)\"", "*Product: \"(B)\""}).product,
                ElementsAre("(B)", "(A)", "(B)"));
}

TEST_F(PPDFile, LeavesOutTheProductsOfDriverPackages) {
    for (const auto* product : {"(GIMP Print)", "(gimp)", "(CUPS v2)", "(AFPL Ghostscript)",
                                "(GNU Ghostscript)", "(ESP Ghostscript)", "(GUTENPRINT v5)", "(Gutenprint)"})
        EXPECT_THAT(parsed({std::string("*Product: \"") + product + "\""}).product, IsEmpty()) << product;
    EXPECT_THAT(parsed({"*Product: \"GIMP\"", "*Product: \" (GIMP)\"", "*Product: \"(GIM)\""}).product,
                ElementsAre("GIMP", " (GIMP)", "(GIM)"));
}

TEST_F(PPDFile, AddsTheHyphenatedSpellingThatTheDevicesUse) {
    EXPECT_THAT(parsed({"*Product: \"(Canon BJC 2000)\""}).product,
                ElementsAre("(Canon BJC 2000)", "(Canon BJC-2000)"));
    // The hyphen's place counts from the value's beginning, wherever the name stands.
    EXPECT_THAT(parsed({"*Product: \"x (Canon BJC 2000)\""}).product,
                ElementsAre("x (Canon BJC 2000)", "x (Canon B-C 2000)"));
    EXPECT_THAT(parsed({"*Product: \"(canon BJC 2000)\""}).product, ElementsAre("(canon BJC 2000)"));
}

TEST_F(PPDFile, AddsItsNamesToTheProductsOnlyWhenNew) {
    EXPECT_THAT(parsed({"*Product: \"Jet\"", "*ModelName: \"Jet\"", "*ShortNickName: \"Jet\""}).product,
                ElementsAre("Jet"));
    EXPECT_THAT(parsed({"*Product: \"(Jet)\"", "*ModelName: \"Jet\"", "*ShortNickName: \"Short\""}).product,
                ElementsAre("(Jet)", "Jet", "Short"));
}

TEST_F(PPDFile, AddsTheProductOfADeviceIDThatNamesMakeAndModel) {
    const auto full = parsed({"*1284DeviceID: \"MFG:HP;MDL:LaserJet 4;\""});
    EXPECT_THAT(full.product, ElementsAre("(HP LaserJet 4)"));
    EXPECT_EQ(full.deviceID, "MFG:HP;MDL:LaserJet 4;");

    const auto known = parsed({"*Product: \"(HP LaserJet 4)\"", "*1284DeviceID: \"MFG:HP;MDL:LaserJet 4;\""});
    EXPECT_THAT(known.product, ElementsAre("(HP LaserJet 4)"));

    const auto modelOnly = parsed({"*1284DeviceID: \"MDL:LaserJet 4;\""});
    EXPECT_THAT(modelOnly.product, IsEmpty());
    EXPECT_EQ(modelOnly.deviceID, "MDL:LaserJet 4;");
}

TEST_F(PPDFile, AddsItsModelNumberToTheProductsEvenWhenItIsThere) {
    const auto record = parsed({"*Product: \"5\"", "*cupsModelNumber: 5"});
    EXPECT_THAT(record.product, ElementsAre("5", "5"));
    EXPECT_EQ(record.modelNumber, "5");
}

TEST_F(PPDFile, FindsKeywordsWithoutRegardToCase) {
    EXPECT_EQ(parsed({"*nickname: \"Jet\""}).makeAndModel, "Jet");
}

struct EncodingCase {
    std::string languageEncoding, bytes, expected;
};

TEST_F(PPDFile, DecodesItsNamesByItsLanguageEncoding) {
    const std::vector<EncodingCase> cases{
        {"ISOLatin1",
         "Dr\xfc"
         "cker \x80",
         "Drücker \u0080"},
        {"WindowsANSI",
         "Dr\xfc"
         "cker \x80",
         "Drücker €"},
        {"JIS83-RKSJ", "\x83\x76\x83\x8a\x83\x93\x83\x5e", "プリンタ"},
        {"JIS83-RKSJ", "\x87\x40", "①"},
        {"UTF-8", "Drücker", "Drücker"},
        {"isolatin1", "Drücker", "Drücker"},
        {"None", "プリンタ", "プリンタ"},
    };
    for (const auto& [encoding, bytes, expected] : cases) {
        const auto named = [&bytes = bytes](const char* keyword) {
            return std::string("*") + keyword + ": \"" + bytes + " x\"";
        };
        const auto record = parsed({"*LanguageEncoding: " + encoding, named("NickName"),
                                    named("Manufacturer"), named("Product"), named("ShortNickName"),
                                    named("cupsModelNumber"), "*1284DeviceID: \"MFG:M;MDL:" + bytes + ";\""});
        EXPECT_EQ(record.makeAndModel, expected + " x") << encoding;
        EXPECT_EQ(record.make, expected + " x") << encoding;
        EXPECT_EQ(record.modelNumber, expected + " x") << encoding;
        EXPECT_EQ(record.deviceID, "MFG:M;MDL:" + expected + ";") << encoding;
        EXPECT_THAT(record.product, ElementsAre(expected + " x", "(M " + expected + ")", expected + " x"))
            << encoding;
        EXPECT_EQ(parsed({"*LanguageEncoding: " + encoding, named("ModelName")}).make,
                  expected.substr(0, expected.find(' ')))
            << encoding;
    }
}

TEST_F(PPDFile, TakesItsOtherValuesAsUTF8WhateverItsEncoding) {
    const auto record =
        parsed({"*LanguageEncoding: ISOLatin1", "*FileVersion: \"1.ü\"", "*LanguageVersion: \"\xfc\"",
                "*PSVersion: \"(ü) 1\"", "*PSVersion: \"(\xfc) 1\"", "*cupsCommands: \"\xfc\"",
                "*cupsLanguages: \"\xfc\"", "*QLDialogExtension: \"/\xfc\"", "*cupsFilter: \"a/a 0 \xfc\"",
                "*cupsFilter: \"a/a 0 ü\""});
    EXPECT_EQ(record.fileVersion, "1.ü");
    EXPECT_EQ(record.languageVersion, std::nullopt);
    EXPECT_THAT(record.psVersion, ElementsAre("(ü) 1"));
    EXPECT_EQ(record.cupsCommands, std::nullopt);
    EXPECT_EQ(record.naturalLanguage, std::nullopt);
    EXPECT_THAT(record.pdes, IsEmpty());
    EXPECT_THAT(record.filters, ElementsAre("a/a 0 ü"));
}

TEST_F(PPDFile, CountsAMalformedValueAsAbsent) {
    for (const auto& [encoding, bytes] :
         std::vector<std::pair<std::string, std::string>>{{"UTF-8", "Jet \xfc"},
                                                          {"UTF-8", "Jet \xc3"},
                                                          {"WindowsANSI", "Jet \x81"},
                                                          {"JIS83-RKSJ", "Jet \x83"}}) {
        const auto record =
            parsed({"*LanguageEncoding: " + encoding, "*NickName: \"" + bytes + "\"",
                    "*Product: \"" + bytes + "\"", "*ModelName: \"Acme 1\"",
                    "*1284DeviceID: \"MFG:a;MDL:" + bytes + "\"", "*cupsModelNumber: \"" + bytes + "\""});
        EXPECT_EQ(record.makeAndModel, "Acme 1") << encoding;
        EXPECT_THAT(record.product, ElementsAre("Acme 1")) << encoding;
        EXPECT_EQ(record.deviceID, "") << encoding;
        EXPECT_EQ(record.modelNumber, std::nullopt) << encoding;
    }
}

TEST_F(PPDFile, NamesItsEncoding) {
    const auto encodingOf = [&](const Lines& lines) {
        const PpdPtr ppd{ppdOpenFile(write(lines).c_str())};
        return PPDManager::stringEncoding(ppd.get());
    };
    EXPECT_EQ(encodingOf({"*LanguageEncoding: ISOLatin1"}), TextEncoding::ISOLatin1);
    EXPECT_EQ(encodingOf({"*LanguageEncoding: WindowsANSI"}), TextEncoding::WindowsCP1252);
    EXPECT_EQ(encodingOf({"*LanguageEncoding: JIS83-RKSJ"}), TextEncoding::ShiftJIS);
    EXPECT_EQ(encodingOf({"*LanguageEncoding: ISOLatin2"}), TextEncoding::UTF8);
    EXPECT_EQ(encodingOf({"*LanguageEncoding: windowsANSI"}), TextEncoding::UTF8);
    EXPECT_EQ(encodingOf({"*ModelName: \"a\""}), TextEncoding::UTF8);
    EXPECT_EQ(PPDManager::stringEncoding(nullptr), TextEncoding::UTF8);
}

TEST_F(PPDFile, WithAnEndlessLineIsNoPPD) {
    for (const std::size_t length : {256UL, 10'000UL, 64UL << 10, 1UL << 20})
        EXPECT_EQ(PPDManager::parsePPD(write({"*1284DeviceID: \"MFG:" + std::string(length, 'x') + ";\""})),
                  std::nullopt)
            << length;
}

TEST_F(PPDFile, MayHaveAVeryLongValueOfManyLines) {
    std::string id = "MFG:Acme;MDL:Jet ";
    while (id.size() < 64 << 10)
        id += std::string(200, 'x') + "\n";
    const auto record = parsed({"*1284DeviceID: \"" + id + "\"", "*End"});
    EXPECT_EQ(record.deviceID, id);
    EXPECT_THAT(record.product, ElementsAre("(Acme " + id.substr(13) + ")"));
}

TEST_F(PPDFile, MayBeCutOffAnywhere) {
    const auto whole = readFile(std::filesystem::path(VENTRAS_SOURCE_DATA_DIR) / "Generic.ppd");
    ASSERT_FALSE(whole.empty());
    for (std::size_t length = 0; length < whole.size(); length += 17) {
        const auto path = folder_.write("cut.ppd", whole.substr(0, length));
        if (const auto record = PPDManager::parsePPD(path)) {
            EXPECT_EQ(record->name, path) << "cut at " << length;
        }
        EXPECT_EQ(PPDManager::isPPDFile(path), length >= 10) << "cut at " << length;
    }
}

TEST_F(PPDFile, MayHoldGarbage) {
    std::mt19937 random(20);
    for (int round = 0; round < 200; ++round) {
        std::string garbage = ppdText({"*ModelName: \"Acme Jet\""});
        for (int i = 0; i < 2000; ++i)
            garbage += static_cast<char>(random() % (round % 2 == 0 ? 256 : 128));
        const auto path = folder_.write("garbage.ppd", garbage);
        EXPECT_TRUE(PPDManager::isPPDFile(path));
        if (const auto record = PPDManager::parsePPD(path)) {
            EXPECT_EQ(record->name, path) << "round " << round;
        }
    }
}

TEST_F(PPDFile, IsToldByItsFirstLine) {
    EXPECT_TRUE(PPDManager::isPPDFile(folder_.write("1", "*PPD-Adobe: \"4.3\"\n")));
    EXPECT_TRUE(PPDManager::isPPDFile(folder_.write("2", "*PPD-Adobe")));
    EXPECT_TRUE(PPDManager::isPPDFile(folder_.write("3", "*PPD-Adobe" + std::string(10'000, 'x'))));
    EXPECT_TRUE(PPDManager::isPPDFile(writeCompressed(folder_, "4", "*PPD-Adobe: \"4.3\"\n")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.write("5", "\n*PPD-Adobe: \"4.3\"\n")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.write("6", "*ppd-adobe: \"4.3\"\n")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.write("7", " *PPD-Adobe: \"4.3\"\n")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.write("8", "*PPD-Adob\n")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.write("9", "")));
    EXPECT_FALSE(PPDManager::isPPDFile(folder_.path()));
    EXPECT_FALSE(PPDManager::isPPDFile("/nonexistent.ppd"));
}

TEST(PPDValidity, IsNeverLookedAt) {
    EXPECT_TRUE(PPDManager::isValidPPD("/nonexistent.ppd"));
    EXPECT_TRUE(PPDManager::isValidPPD(""));
}

TEST(PPDLocalization, IsACopy) {
    EXPECT_EQ(PPDManager::localizedPPD("/a/b.ppd"), "/a/b.ppd");
    EXPECT_EQ(PPDManager::localizedPPD(""), "");
}

}  // namespace
}  // namespace ventras
