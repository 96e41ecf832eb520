#include "agent/CommandLine.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace ventras {

void PrintTo(ArgumentKind kind, std::ostream* out) {
    *out << static_cast<int>(kind);
}

namespace {

struct Case {
    std::string_view argument;
    ArgumentKind kind;
    std::string_view text;
};

using enum ArgumentKind;

// In the order of the tests, each with its near misses.
constexpr Case kCases[] = {
    {"-b", Deprecated, "-b"},
    {"-bold", Deprecated, "-bold"},
    {"-b--skerrow", Deprecated, "-b--skerrow"},
    {"-t", Deprecated, "-t"},
    {"-t5", Deprecated, "-t5"},
    {"-d", Deprecated, "-d"},
    {"-download", Deprecated, "-download"},
    {"-dipp://x", Deprecated, "-dipp://x"},

    {"-u336592896,0", UsbLocation, "336592896,0"},
    {"-u", UsbLocation, ""},
    {"-u--skerrow", UsbLocation, "--skerrow"},

    {"--scannerUUID,a,b", Scanner, "UUID,a,b"},
    {"--scanner", Scanner, ""},
    {"--scanner--skerrow", Scanner, "--skerrow"},
    {"-sUUID,a,b", Scanner, "UUID,a,b"},
    {"-s", Scanner, ""},
    {"-s--skerrow", Scanner, "--skerrow"},
    {"-scanner", Scanner, "canner"},
    {"--scanne", Ignored, "--scanne"},

    {"--download", NoDownload, "--download"},
    {"--download ", Ignored, "--download "},
    {"--downloads", Ignored, "--downloads"},
    {" --download", Ignored, " --download"},
    {"--Download", Ignored, "--Download"},

    {"--skerrow", Skerrow, "--skerrow"},
    {"x--skerrow", Skerrow, "x--skerrow"},
    {"ipp://x--skerrow", Skerrow, "ipp://x--skerrow"},
    {"ippusb://x--skerrow", Skerrow, "ippusb://x--skerrow"},
    {"--download--skerrow", Skerrow, "--download--skerrow"},
    {"---skerrow", Skerrow, "---skerrow"},
    {"--skerrow ", Ignored, "--skerrow "},
    {"-skerrow", Scanner, "kerrow"},

    {"ippusb://Office", IppUsb, "Office"},
    {"ippusb://", IppUsb, ""},
    {"ippusb:/Office", Ignored, "ippusb:/Office"},
    {"IPPUSB://Office", Ignored, "IPPUSB://Office"},

    {"ipp://printer/ipp/print", NetworkURI, "ipp://printer/ipp/print"},
    {"ipps://printer/ipp/print", NetworkURI, "ipps://printer/ipp/print"},
    {"ipp://", NetworkURI, "ipp://"},
    {"ipps://", NetworkURI, "ipps://"},
    {"ipp:/printer", Ignored, "ipp:/printer"},
    {"IPP://printer", Ignored, "IPP://printer"},
    {" ipp://printer", Ignored, " ipp://printer"},

    {"", Ignored, ""},
    {"-", Ignored, "-"},
    {"--", Ignored, "--"},
    {"-x", Ignored, "-x"},
    {"-B", Ignored, "-B"},
    {"-U1,0", Ignored, "-U1,0"},
    {"usb://Acme/Laser", Ignored, "usb://Acme/Laser"},
    {"socket://printer", Ignored, "socket://printer"},
    {"a -b", Ignored, "a -b"},
};

TEST(CommandLine, TellsEachArgumentApartByTheFirstRuleThatHolds) {
    for (const auto& [argument, kind, text] : kCases) {
        const auto parsed = parseArgument(argument);
        EXPECT_EQ(parsed.kind, kind) << argument;
        EXPECT_EQ(parsed.text, text) << argument;
    }
}

TEST(CommandLine, GivesTheSameScannerForBothSpellings) {
    const std::string description = "12-34,usb:1,Scanner,,USB,336592896,1,2";
    EXPECT_EQ(parseArgument("-s" + description).text, parseArgument("--scanner" + description).text);
}

}  // namespace
}  // namespace ventras
