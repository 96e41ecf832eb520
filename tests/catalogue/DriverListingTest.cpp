#include "catalogue/DriverListing.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

TEST(DriverListing, ReadsTheLinesOfADriverProgram) {
    EXPECT_EQ(
        driverFromListing(R"("escpr:0/a.ppd" en "Epson" "Epson XP-850, ESC/P-R" "MFG:EPSON;MDL:XP-850;")"),
        (ListedDriver{"Epson", "Epson XP-850, ESC/P-R", "MFG:EPSON;MDL:XP-850;"}));
    EXPECT_EQ(driverFromListing(R"("g://bjc/expert" en "Canon" "Canon PIXMA" "")"),
              (ListedDriver{"Canon", "Canon PIXMA", ""}));
    EXPECT_EQ(driverFromListing(R"("g://bjc/expert" en "Canon" "Canon PIXMA")"),
              (ListedDriver{"Canon", "Canon PIXMA", ""}));
    for (const std::string_view line :
         {"", "DEBUG: no line", R"("uri" en "make")", R"("uri" en "make" "cut off)"})
        EXPECT_EQ(driverFromListing(line), std::nullopt) << line;
}

struct TagCase {
    ListedDriver driver;
    std::optional<std::string> tag;
};

TEST(DeviceTag, ComesFromTheDeviceIDAndElseFromTheNames) {
    const TagCase cases[] = {
        {{"Epson", "Epson XP-850, ESC/P-R", "MFG:EPSON;MDL:XP-850 Series;"},
         "MANUFACTURER:EPSON;MODEL:XP-850 Series"},
        {{"Canon", "Canon PIXMA MG5380 - CUPS+Gutenprint v5.3.4", ""},
         "MANUFACTURER:Canon;MODEL:PIXMA MG5380"},
        {{"Samsung", "Samsung CLP-200, 2.0.0", ""}, "MANUFACTURER:Samsung;MODEL:CLP-200"},
        {{"HP", "HP LaserJet 5 Foomatic/ljet4 (recommended)", "CMD:PCL;"},
         "MANUFACTURER:HP;MODEL:LaserJet 5"},
        {{"HP", "HP LaserJet 5 Postscript (recommended)", ""}, "MANUFACTURER:HP;MODEL:LaserJet 5"},
        {{"HP", "HP LaserJet 5", "MFG:HP;MDL:;"}, "MANUFACTURER:HP;MODEL:LaserJet 5"},
        {{"", "LaserJet 5", ""}, std::nullopt},
        {{"HP", "", ""}, std::nullopt},
        {{"HP", ", 1.0", ""}, std::nullopt},
        {{"HP", "bell\a", ""}, std::nullopt},
        {{"HP", std::string(300, 'x'), ""}, std::nullopt},
    };
    for (const auto& [driver, tag] : cases)
        EXPECT_EQ(deviceTag(driver), tag) << driver.makeAndModel;
}

TEST(FoomaticDriver, IsNamedBehindTheModel) {
    EXPECT_EQ(foomaticDriver({"", "Minolta PagePro 1300W Foomatic/min12xxw (recommended)", ""}), "min12xxw");
    EXPECT_EQ(foomaticDriver({"", "HP LaserJet 4 Foomatic/hpijs-pcl5e", ""}), "hpijs-pcl5e");
    EXPECT_EQ(foomaticDriver({"", "HP LaserJet 4 PCL", ""}), "");
}

}  // namespace
}  // namespace ventras
