#include <gtest/gtest.h>

#include "tests/ctl/Ctl.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

constexpr auto kCatalogue = R"JSON([
    {"ppd_name": "server.ppd", "ppd_product": ["(DeskJet 500)"]},
    {"ppd_name": "/installed.ppd", "ppd_device_id": "MFG:HP;MDL:DeskJet 500;"},
    {"ppd_name": "other.ppd", "ppd_make_and_model": "Other"}
])JSON";

constexpr auto kBoth =
    R"JSON([{"record":{"ppd_device_id":"MFG:HP;MDL:DeskJet 500;","ppd_name":"/installed.ppd"},"kind":3,)JSON"
    R"JSON("reason":"the model in its device ID is equal"},)JSON"
    R"JSON({"record":{"ppd_name":"server.ppd","ppd_product":["(DeskJet 500)"]},"kind":8,)JSON"
    R"JSON("reason":"its product is equal"}])JSON"
    "\n";

class MatchCommand : public testing::Test {
protected:
    ProgramResult match(std::vector<std::string> arguments, const std::string& input = "") {
        arguments.insert(arguments.begin(), {"match", "--catalogue", catalogue_});
        return ctlReading(input, arguments);
    }

    TemporaryFolder folder_;
    std::string catalogue_ = folder_.write("catalogue.json", kCatalogue).string();
};

TEST_F(MatchCommand, ShowsTheDriversThatFitBestFirst) {
    const auto run = match({"--json", "--model", "deskjet 500", "--product", "(DeskJet 500)"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput, kBoth);
}

TEST_F(MatchCommand, TakesADeviceID) {
    const auto run = match({"--json", "--device-id=MFG:;MDL:Other"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_EQ(run.standardOutput,
              R"([{"record":{"ppd_make_and_model":"Other","ppd_name":"other.ppd"},"kind":8,)"
              R"("reason":"its name is equal"}])"
              "\n");
}

TEST_F(MatchCommand, FindsNothingForNothing) {
    const auto run = match({"--json"});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_EQ(run.standardOutput, "[]\n");
}

TEST_F(MatchCommand, AnswersJsonObjectsLineByLine) {
    const auto run =
        match({"-"}, R"JSON({"model":"DeskJet 500","product":"(DeskJet 500)","deviceID":null})JSON"
                     "\n{}\n"
                     R"({"model":5})"
                     "\n");
    EXPECT_EQ(run.exitStatus, 2);
    EXPECT_EQ(run.standardOutput, std::string(kBoth) + "[]\nnull\n");
    EXPECT_EQ(run.standardError, "ventrasctl: line 3 is not what this command reads\n");
}

TEST_F(MatchCommand, ShowsATableForPeople) {
    const auto run = match({"--model", "Other"});
    EXPECT_EQ(run.standardOutput,
              "KIND  DRIVER  NAME       WHY\n"
              "8     Other   other.ppd  its name is equal\n");
}

TEST_F(MatchCommand, RefusesACatalogueThatIsNone) {
    for (const std::string content : {"", "{}", "[1]", "[null]"}) {
        const auto path = folder_.write("bad.json", content).string();
        EXPECT_EQ(ctl({"match", "--model", "x", "--catalogue", path}).exitStatus, 2) << content;
    }
    for (const auto& path : {folder_ / "missing", folder_.path()}) {
        const auto run = ctl({"match", "--model", "x", "--catalogue", path});
        EXPECT_EQ(run.exitStatus, 1) << path;
        EXPECT_EQ(run.standardError, "ventrasctl: " + path.string() + ": cannot be read\n");
    }
}

}  // namespace
}  // namespace ventras
