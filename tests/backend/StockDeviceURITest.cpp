#include <gtest/gtest.h>

#include <span>
#include <string>
#include <string_view>

#include "backend/usb/StockDeviceURI.h"

namespace ventras {
namespace {

struct UriCase {
    std::string_view queue, stock;
};

// What the stock backend of CUPS 2.4 lists for the same make and model.
constexpr UriCase kRepeatedMakes[] = {
    {"usb://HP/HP%20LaserJet?serial=C4", "usb://HP/LaserJet?serial=C4"},
    {"usb://HP/hp%20LaserJet?serial=C4", "usb://HP/LaserJet?serial=C4"},
    {"usb://EPSON/Epson%20Stylus", "usb://EPSON/Stylus"},
    {"usb://hp/HP%20LaserJet", "usb://hp/LaserJet"},
    {"usb://HP/HP%20%20%20LaserJet%20%204", "usb://HP/LaserJet%20%204"},
    {"usb://HP/HP%09LaserJet", "usb://HP/LaserJet"},
    {"usb://KONICA%20MINOLTA/KONICA%20MINOLTA%20magicolor/2300", "usb://KONICA%20MINOLTA/magicolor/2300"},
    {"usb://HP/HP%20HP%20LaserJet", "usb://HP/HP%20LaserJet"},
    {"usb://K%2FM/K/M%20x?serial=1", "usb://K%2FM/x?serial=1"},
    {"usb://%C3%B6/%C3%B6%20%C3%BC", "usb://%C3%B6/%C3%BC"},
};

TEST(StockDeviceURI, HasTheModelWithoutTheMake) {
    for (const auto& [queue, stock] : kRepeatedMakes)
        EXPECT_EQ(stockDeviceURI(queue), stock) << queue;
}

constexpr UriCase kLongMakes[] = {
    {"usb://Hewlett-Packard/LaserJet?serial=1", "usb://HP/LaserJet?serial=1"},
    {"usb://hewlett-packard/HP%20LaserJet?serial=1", "usb://HP/LaserJet?serial=1"},
    {"usb://Lexmark%20International/E120", "usb://Lexmark/E120"},
    {"usb://LEXMARK%20INTERNATIONAL/Lexmark%20E120", "usb://Lexmark/E120"},
    // The make is dropped in its short form only.
    {"usb://Hewlett-Packard/Hewlett-Packard%20LaserJet", "usb://HP/Hewlett-Packard%20LaserJet"},
    {"usb://Lexmark%20International/Lexmark%20International%20E120", "usb://Lexmark/International%20E120"},
    // A make counts as a whole.
    {"usb://Hewlett-Packard%20Company/HP%20LaserJet", "usb://Hewlett-Packard%20Company/HP%20LaserJet"},
    {"usb://Hewlett%20Packard/LaserJet", "usb://Hewlett%20Packard/LaserJet"},
    {"usb://Lexmark%20International,%20Inc./E120", "usb://Lexmark%20International,%20Inc./E120"},
};

TEST(StockDeviceURI, HasTheMakeInShort) {
    for (const auto& [queue, stock] : kLongMakes)
        EXPECT_EQ(stockDeviceURI(queue), stock) << queue;
}

constexpr UriCase kLocations[] = {
    {"usb://Brother/DCP-7030?location=1400000", "usb://Brother/DCP-7030"},
    {"usb://HP/HP%20LaserJet?location=0", "usb://HP/LaserJet"},
    {"usb://Brother/DCP-7030?serial=1?location=2", "usb://Brother/DCP-7030?serial=1?location=2"},
};

TEST(StockDeviceURI, HasNoLocation) {
    for (const auto& [queue, stock] : kLocations)
        EXPECT_EQ(stockDeviceURI(queue), stock) << queue;
}

constexpr std::string_view kUnchanged[] = {
    "usb://HP/LaserJet?serial=C4",
    "usb://Brother/DCP-7030",
    "usb://Example/X?serial=B7&interface=1",
    "usb://HP/HPLaserJet",
    "usb://HP/HP-LaserJet",
    "usb://HP/HP",
    "usb://HP/HP%20",
    "usb://HP/",
    "usb://HP/HP/LaserJet",
    "usb://EPSON/SEIKO%20EPSON%20X",
    "usb:///A%20B",
    "usb:///%20B",
    "usb://A&B/x?y#z?serial=%201%20",
    "usb://HP/100%",
    "usb://HP/HP%zzLaserJet",
    // Not what the agent makes.
    "",
    "usb",
    "usb:",
    "usb://",
    "usb://HP",
    "USB://HP/HP%20LaserJet",
    "ipp://HP/HP%20LaserJet",
    "ippusb://HP/HP%20LaserJet?location=1",
    "socket://HP/HP%20LaserJet",
};

TEST(StockDeviceURI, IsTheQueuesOwnWhereNothingIsLongerThanNeeded) {
    for (const auto uri : kUnchanged)
        EXPECT_EQ(stockDeviceURI(uri), uri);
}

TEST(StockDeviceURI, IsTheQueuesOwnWhenItIsTooLongForLibcups) {
    const auto uri = "usb://HP/HP%20" + std::string(2000, 'x');
    EXPECT_EQ(stockDeviceURI(uri), uri);
}

TEST(StockDeviceURI, StaysAsItIsOnceItIsShort) {
    for (const auto& table : {std::span<const UriCase>(kLongMakes), std::span<const UriCase>(kLocations)})
        for (const auto& [queue, stock] : table)
            EXPECT_EQ(stockDeviceURI(stock), stock);
}

}  // namespace
}  // namespace ventras
