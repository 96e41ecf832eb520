#include "catalogue/ScanIDKey.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

using Key = std::optional<std::string>;

struct KeyCase {
    std::string deviceID;
    Key key;
};

TEST(ScanIDKey, IsTheSameForEverySpellingOfADevice) {
    const KeyCase cases[] = {
        {"MANUFACTURER:HP;MODEL:LaserJet 4", "hp;laserjet 4"},
        {"MANUFACTURER:hp;MODEL:LASERJET 4", "hp;laserjet 4"},
        {"MANUFACTURER:Hewlett-Packard;MODEL:LaserJet 4", "hp;laserjet 4"},
        {"MANUFACTURER:HEWLETT-PACKARD;MODEL:HP LaserJet 4", "hp;laserjet 4"},
        {"MANUFACTURER:HP;MODEL:Hewlett-Packard HP LaserJet 4", "hp;laserjet 4"},
        {"MANUFACTURER:  HP ;MODEL:\tLaserJet   4 ", "hp;laserjet 4"},
        {"MFG:HP;MDL:LaserJet 4;CMD:PCL;SN:1;", "hp;laserjet 4"},
        {"usb_MFG:HP;usb_MDL:HP LaserJet 4;", "hp;laserjet 4"},
        {"product:(HP LaserJet 4)", "hp;laserjet 4"},
        {"MANUFACTURER:Kyocera Mita;MODEL:Kyocera Mita FS-1000", "kyocera;fs-1000"},
        {"MANUFACTURER:Kyocera;MODEL:FS-1000", "kyocera;fs-1000"},
        {"MANUFACTURER:Lexmark International;MODEL:Lexmark E120", "lexmark;e120"},
        {"MANUFACTURER:OKI DATA CORP;MODEL:B4300", "oki;b4300"},
        {"MANUFACTURER:Eastman Kodak Company;MODEL:KODAK ESP-3 AiO", "kodak;esp-3 aio"},
        {"MANUFACTURER:UTAX/TA;MODEL:CD 1018", "utax_ta;cd 1018"},
    };
    for (const auto& [deviceID, key] : cases)
        EXPECT_EQ(scanIDKey(deviceID), key) << deviceID;
}

TEST(ScanIDKey, KeepsDevicesApart) {
    const KeyCase cases[] = {
        {"MANUFACTURER:HP;MODEL:LaserJet 4L", "hp;laserjet 4l"},
        {"MANUFACTURER:HP;MODEL:LaserJet4", "hp;laserjet4"},
        {"MANUFACTURER:HPE;MODEL:LaserJet 4", "hpe;laserjet 4"},
        {"MANUFACTURER:HP;MODEL:HPLaserJet", "hp;hplaserjet"},
        {"MANUFACTURER:HP;MODEL:HP", "hp;hp"},
        {"MANUFACTURER:Fuji;MODEL:Xerox 1", "fuji;xerox 1"},
        {"MANUFACTURER:印刷;MODEL:機 1", "印刷;機 1"},
        {"MANUFACTURER:A\xff;MODEL:B\xfe", "a\xff;b\xfe"},
    };
    for (const auto& [deviceID, key] : cases)
        EXPECT_EQ(scanIDKey(deviceID), key) << deviceID;
}

TEST(ScanIDKey, IsAbsentWithoutMakerOrModel) {
    for (const std::string deviceID :
         {"", "printing software", "MANUFACTURER:HP", "MODEL:LaserJet 4", "MANUFACTURER:;MODEL:X500",
          "MANUFACTURER:HP;MODEL:", "MANUFACTURER: ;MODEL:X", "MANUFACTURER:HP;MODEL: \t"})
        EXPECT_EQ(scanIDKey(deviceID), std::nullopt) << deviceID;
}

TEST(ScanIDKey, ReadsLongIDsInReasonableTime) {
    const std::string model(60'000, 'x');
    EXPECT_EQ(scanIDKey("MANUFACTURER:HP;MODEL:" + model), "hp;" + model);
    std::string repeated;
    for (int i = 0; i < 20'000; ++i)
        repeated += "HP ";
    EXPECT_EQ(scanIDKey("MANUFACTURER:HP;MODEL:" + repeated + "1"), "hp;1");
}

}  // namespace
}  // namespace ventras
