#include <gtest/gtest.h>

#include "tests/ctl/Answers.h"
#include "tests/ctl/Ctl.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

constexpr auto kPPD =
    "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*FileVersion: \"1.0\"\n*LanguageVersion: English\n"
    "*LanguageEncoding: WindowsANSI\n*PCFileName: \"X.PPD\"\n*Manufacturer: \"Acme\"\n*Product: \"(Acme "
    "X)\"\n"
    "*ModelName: \"Acme X\"\n*ShortNickName: \"Acme X\"\n*NickName: \"Acme X\"\n*PSVersion: \"(3010) 1\"\n"
    "*LanguageLevel: \"3\"\n*ColorDevice: True\n*cupsFax: True\n"
    "*cupsFilter: \"a/b 0 one\"\n*cupsFilter: \"c/d 0 two\"\n";

Object printed(const ProgramResult& run) {
    const auto value = parseJson(run.standardOutput);
    return value && std::holds_alternative<Object>(*value) ? std::get<Object>(*value) : Object{};
}

TEST(PPDCommand, ShowsRecordKindAndTypes) {
    const TemporaryFolder folder;
    const auto path = folder.write("x.ppd", kPPD).string();
    const auto run = ctl({"ppd", "--json", path});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto answers = printed(run);
    EXPECT_EQ(json(answers, "kind"), "3");
    EXPECT_EQ(json(answers, "isPPDFile"), "true");
    EXPECT_EQ(json(answers, "isValidPPD"), "true");
    EXPECT_EQ(json(answers, "isFaxPPD"), "true");
    EXPECT_EQ(json(answers, "isPostscriptPPD"), "false");
    EXPECT_EQ(json(answers, "isRasterPPD"), "false");
    EXPECT_EQ(json(answers, "stringEncoding"), "\"windows-1252\"");

    const auto& record = std::get<Object>(*find(answers, "record"));
    EXPECT_EQ(json(record, "ppd_name"), "\"" + path + "\"");
    EXPECT_EQ(json(record, "ppd_filters"), R"(["c/d 0 two","a/b 0 one"])");
    EXPECT_EQ(json(record, "ppd_color"), "true");
    EXPECT_EQ(json(record, "ppd_language_level"), "3");
    EXPECT_EQ(json(record, "ppd_inktool"), "(missing)");
}

TEST(PPDCommand, HasNoRecordOfWhatDoesNotOpen) {
    const TemporaryFolder folder;
    const auto garbage = folder.write("garbage", "no PPD\n").string();
    const auto run = ctl({"ppd", "--json", garbage});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_EQ(run.standardOutput,
              R"({"record":null,"kind":10,"isPPDFile":false,"isValidPPD":true,"isFaxPPD":null,)"
              R"("isPostscriptPPD":null,"isRasterPPD":null,"stringEncoding":"UTF-8"})"
              "\n");
    EXPECT_EQ(run.standardError, "ventrasctl: " + garbage + ": no PPD that can be opened\n");
    EXPECT_EQ(ctl({"ppd", "--json", folder.path() / "missing"}).exitStatus, 1);
}

TEST(PPDCommand, GoesOnAfterAFileThatDoesNotOpen) {
    const TemporaryFolder folder;
    const auto good = folder.write("x.ppd", kPPD).string();
    const auto run = ctl({"ppd", "--json", "/dev/null", good});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_NE(run.standardOutput.find("\n{\"record\":{"), std::string::npos) << run.standardOutput;
}

TEST(KindCommand, RanksEachRecord) {
    const auto run = ctlReading(
        R"([null, {}, {"ppd_name": "/x/HPIJS.ppd"}, {"ppd_name": "drv:///sample.drv/generic.ppd"},
            {"ppd_name": "/x", "ppd_natural_language": ["en"]}, {"ppd_name": "/x", "ppd_natural_language": null},
            {"KioskoSUDriverPredicateStr": "a", "ppd_filters": ["application/Tioga 0 -"]},
            {"KioskoSUDriverPredicateStr": "a", "kKioskoSUDriverConflicts": 0.5},
            {"ppd_filters": ["application/Tioga 0 -"]}, {"ppd_secure_vellum": true},
            {"ppd_secure_vellum": "true"}, {"ppd_name": "Vellum.ppd", "unknown": {"a": [1]}}])",
        {"kind", "--json"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, "[10,8,6,8,2,3,4,5,9,0,8,1]\n");
}

TEST(KindCommand, NamesTheKindsForPeople) {
    const auto run = ctlReading(R"([{"ppd_name":"/x"}])", {"kind"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, "KIND  MEANING\n3     installed\n");
}

TEST(KindCommand, RefusesWhatIsNoArrayOfRecords) {
    for (const std::string input : {"", "{}", "[", "3", "[3]", R"(["x"])", "[[]]", "\xFF"}) {
        const auto run = ctlReading(input, {"kind", "--json"});
        EXPECT_EQ(run.exitStatus, 2) << input;
        EXPECT_EQ(run.standardOutput, "") << input;
    }
}

}  // namespace
}  // namespace ventras
