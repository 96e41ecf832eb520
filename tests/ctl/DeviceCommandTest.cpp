#include <gtest/gtest.h>

#include "ctl/Json.h"
#include "tests/ctl/Ctl.h"

namespace ventras {
namespace {

TEST(ScannerCommand, ShowsTheDescriptionAndItsPPD) {
    const auto run = ctl({"scanner", "--json", "UUID-1,id-1,Acme Scan,/icon.png,USB,305419896,2,3,/module"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    EXPECT_TRUE(run.standardOutput.starts_with(
        R"({"uuidString":"UUID-1","persistentID":"id-1","transportType":"USB","name":"Acme Scan",)"
        R"("iconPath":"/icon.png","modulePath":"/module",)"))
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find(R"("usbLocationID":305419896,"usbProductID":2,"usbVendorID":3,)"),
              std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find(R"("isMFP":false,"deviceURI":"usb://UUID-1",)"), std::string::npos)
        << run.standardOutput;
    EXPECT_NE(run.standardOutput.find(R"("ppdFile":"*PPD-Adobe)"), std::string::npos) << run.standardOutput;
}

TEST(ScannerCommand, HasNothingForWhatIsNoDescription) {
    const auto run = ctl({"scanner", "--json", "UUID-1,id-1"});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_EQ(run.standardOutput, "null\n");
}

TEST(PredicateCommand, PrintsTheText) {
    const auto run = ctl({"predicate", "--json", "MANUFACTURER:Acme;MODEL:X"});
    EXPECT_EQ(run.exitStatus, 0) << run.standardError;
    const auto value = parseJson(run.standardOutput);
    ASSERT_TRUE(value && std::holds_alternative<std::string>(*value)) << run.standardOutput;
    EXPECT_NE(std::get<std::string>(*value).find("MANUFACTURER:Acme;MODEL:X"), std::string::npos);
    EXPECT_EQ(ctl({"predicate", "MANUFACTURER:Acme;MODEL:X"}).standardOutput,
              std::get<std::string>(*value) + "\n");
}

TEST(PredicateCommand, HasNoneForEmptyIDs) {
    const auto run = ctl({"predicate", "--json", "", ""});
    EXPECT_EQ(run.exitStatus, 1);
    EXPECT_EQ(run.standardOutput, "null\n");
}

}  // namespace
}  // namespace ventras
