#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "ctl/Json.h"
#include "tests/ctl/Ctl.h"

namespace ventras {
namespace {

constexpr auto kLaserJet =
    R"_({"make":"HP","model":"LaserJet 4","serialNumber":"X1","commandSet":"PCL,PJL","compatibleIDs":null,)_"
    R"_("product":"(HP LaserJet 4)","deviceName":"HP LaserJet 4",)_"
    R"_("softwareUpdateScaneID":"MANUFACTURER:HP;MODEL:LaserJet 4","supportsPostscript":false,"supportsPCL":true,)_"
    R"_("supportsScanning":true,"dictionaryValue":{"cmd":"PCL,PJL","mdl":"LaserJet 4","mfg":"HP","sn":"X1"}})_"
    "\n";

constexpr auto kNothing =
    R"_({"make":null,"model":null,"serialNumber":null,"commandSet":null,"compatibleIDs":null,"product":"",)_"
    R"_("deviceName":"Unknown","softwareUpdateScaneID":null,"supportsPostscript":true,"supportsPCL":false,)_"
    R"_("supportsScanning":true,"dictionaryValue":null})_"
    "\n";

TEST(DeviceIDCommand, PrintsOneJsonLineForEachDeviceID) {
    const auto run = ctl({"device-id", "--json", "MFG:HP;MDL:LaserJet 4;CMD:PCL,PJL;SN:X1", ""});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, std::string(kLaserJet) + kNothing);
}

TEST(DeviceIDCommand, AnswersLinesWithJsonLines) {
    const auto run =
        ctlReading("MFG:HP;MDL:LaserJet 4;CMD:PCL,PJL;SN:X1\n\nMFG:HP;MDL:LaserJet 4;CMD:PCL,PJL;SN:X1",
                   {"device-id", "-"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, std::string(kLaserJet) + kNothing + kLaserJet);
}

TEST(DeviceIDCommand, AnswersALineBeforeTheNextIsSent) {
    // The shell sends the second line only when it has read the answer to the first.
    const auto run =
        runProgram({"bash", "-c",
                    "coproc \"$0\" device-id -; echo MFG:A >&${COPROC[1]}; read -t 20 -u ${COPROC[0]} first;"
                    "echo \"$first\" | cut -c-12",
                    VENTRAS_TEST_CTL});
    EXPECT_EQ(run.standardOutput, "{\"make\":\"A\",\n") << run.standardError;
}

TEST(DeviceIDCommand, ListsTheAnswersForPeople) {
    const auto run = ctl({"device-id", "MFG:HP;MDL:LaserJet 4"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(run.standardOutput.find("\nmodel                  LaserJet 4\n"), std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find("\nserialNumber           -\n"), std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find("\nsupportsPostscript     yes\n"), std::string::npos)
        << run.standardOutput;
}

TEST(DeviceIDCommand, KeepsTerminalControlsOutOfTheList) {
    const auto run = ctl({"device-id", "MFG:\x1B[2J\xC2\x9B;MDL:x\ny\xFF"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(run.standardOutput.find("make                   \xEF\xBF\xBD[2J\xEF\xBF\xBD\n"),
              std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find("model                  x\xEF\xBF\xBDy\xEF\xBF\xBD\n"),
              std::string::npos)
        << run.standardOutput;
}

TEST(DeviceIDCommand, ReplacesBytesThatJsonCannotHold) {
    const auto run = ctl({"device-id", "--json", "MFG:A\xFF;\xFE:\x01"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(run.standardOutput.find("\"make\":\"A\xEF\xBF\xBD\""), std::string::npos) << run.standardOutput;
    EXPECT_NE(run.standardOutput.find("\"\xEF\xBF\xBD\":\"\\u0001\""), std::string::npos)
        << run.standardOutput;
}

TEST(DeviceIDCommand, AnswersEveryLineOfRandomBytes) {
    std::mt19937 random(1284);
    std::string input;
    std::size_t lines = 0;
    for (int i = 0; i < 200000; ++i)
        input += i % 17 == 0 ? "MFG:" : std::string(1, static_cast<char>(random() & 0xFFU));
    input += '\n';
    lines = static_cast<std::size_t>(std::ranges::count(input, '\n'));

    const auto run = ctlReading(input, {"device-id", "-"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(static_cast<std::size_t>(std::ranges::count(run.standardOutput, '\n')), lines);
    std::size_t begin = 0;
    for (std::size_t end; (end = run.standardOutput.find('\n', begin)) != std::string::npos;
         begin = end + 1) {
        const auto line = run.standardOutput.substr(begin, end - begin);
        ASSERT_TRUE(parseJson(line)) << line;
    }
}

constexpr auto kDescribed =
    R"_({"make":"HP","model":"HP LaserJet","serialNumber":null,"commandSet":"image/urf","compatibleIDs":null,)_"
    R"_("product":"(HP LaserJet)","softwareUpdateScaneID":"MANUFACTURER:HP;MODEL:LaserJet",)_"
    R"_("supportsPostscript":false,"supportsPCL":false,"supportsScanning":true,)_"
    R"_("stringValue":"pdl:image/urf;usb_MDL:HP LaserJet;usb_MFG:HP"})_"
    "\n";

TEST(TXTCommand, AnswersForItsPairs) {
    const auto run = ctl({"txt", "--json", "usb_MFG=HP", "usb_MDL=HP LaserJet", "pdl=image/urf"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_EQ(run.standardOutput, kDescribed);
}

TEST(TXTCommand, SplitsAtTheFirstEqualsSign) {
    const auto run = ctl({"txt", "--json", "MFG=a=b", "=", "MDL="});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(run.standardOutput.find(R"("make":"a=b","model":"",)"), std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find(R"("stringValue":":;MDL:;MFG:a=b")"), std::string::npos)
        << run.standardOutput;
}

TEST(TXTCommand, AnswersForAnEmptyDictionary) {
    const auto run = ctl({"txt", "--json"});
    EXPECT_EQ(run.exitStatus, 0);
    EXPECT_NE(
        run.standardOutput.find(R"_("product":"","softwareUpdateScaneID":null,"supportsPostscript":true,)_"
                                R"("supportsPCL":false,"supportsScanning":true,"stringValue":"")"),
        std::string::npos)
        << run.standardOutput;
}

TEST(TXTCommand, RefusesWhatIsNoPair) {
    const auto run = ctl({"txt", "MFG=HP", "MDL"});
    EXPECT_EQ(run.exitStatus, 2);
    EXPECT_EQ(run.standardOutput, "");
    EXPECT_NE(run.standardError.find("'MDL'"), std::string::npos) << run.standardError;
}

TEST(TXTCommand, AnswersJsonObjectsLineByLine) {
    const std::string object = R"({"usb_MFG":"HP","usb_MDL":"HP LaserJet","pdl":"image/urf","MFG":null})";
    const auto run = ctlReading(object + "\n" + object + "\n", {"txt", "-"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, std::string(kDescribed) + kDescribed);
}

TEST(TXTCommand, AnswersALineThatIsNoDictionaryWithNull) {
    for (const std::string line : {"", "[]", "{", "3", R"({"MFG":1})", R"({"MFG":["HP"]})", "\xFF"}) {
        const auto run = ctlReading(line + "\n{}\n", {"txt", "-"});
        EXPECT_EQ(run.exitStatus, 2) << line;
        EXPECT_TRUE(run.standardOutput.starts_with("null\n{\"make\":null,")) << line << "\n"
                                                                             << run.standardOutput;
        EXPECT_EQ(run.standardError, "ventrasctl: line 1 is not what this command reads\n") << line;
    }
}

TEST(TXTCommand, RefusesNestingThatWouldExhaustTheStack) {
    constexpr std::size_t kDepth = 1000000;
    const auto run = ctlReading(std::string(kDepth, '[') + std::string(kDepth, ']') + "\n", {"txt", "-"});
    EXPECT_EQ(run.exitStatus, 2);
    EXPECT_EQ(run.standardOutput, "null\n");
}

}  // namespace
}  // namespace ventras
