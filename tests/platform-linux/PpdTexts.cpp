#include "tests/platform-linux/PpdTexts.h"

namespace ventras {

std::string ppdWith(std::string_view moreLines) {
    constexpr std::string_view kHead = R"ppd(*PPD-Adobe: "4.3"
*FormatVersion: "4.3"
*FileVersion: "1.0"
*LanguageVersion: English
*LanguageEncoding: ISOLatin1
*PCFileName: "TEST.PPD"
*Manufacturer: "Acme"
*Product: "(Acme Laser)"
*ModelName: "Acme Laser"
*ShortNickName: "Acme Laser"
*NickName: "Acme Laser, test"
*OpenUI *PageSize/Media Size: PickOne
*DefaultPageSize: A4
*PageSize A4/A4: "<</PageSize[595 842]>>setpagedevice"
*CloseUI: *PageSize
*OpenUI *PageRegion/Media Size: PickOne
*DefaultPageRegion: A4
*PageRegion A4/A4: "<</PageSize[595 842]>>setpagedevice"
*CloseUI: *PageRegion
*DefaultImageableArea: A4
*ImageableArea A4: "12 12 583 830"
*DefaultPaperDimension: A4
*PaperDimension A4: "595 842"
)ppd";
    return std::string(kHead) + std::string(moreLines);
}

std::string driverlessPpdText() {
    return ppdWith("*cupsFilter2: \"image/urf image/urf 0 -\"\n*cupsSNMPSupplies: False\n");
}

std::string scannerPpdText(std::string_view name) {
    const std::string text(name);
    return "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*LanguageEncoding: ISOLatin1\n*LanguageVersion: "
           "English\n"
           "*FileVersion: \"1.0\"\n*PCFileName: \"Scanner.ppd\"\n*Manufacturer: \"Scanner Printer "
           "Manufacturer\"\n"
           "*Product: \"(Scanner)\"\n*ModelName: \"" +
           text + "\"\n*ShortNickName: \"" + text + "\"\n*NickName: \"" + text +
           "\"\n*QLScannerOnly: True\n*QLScannerUUID: \"some-uuid\"\n*QLICADriver: True\n*cupsLanguages: "
           "\"en\"\n";
}

}  // namespace ventras
