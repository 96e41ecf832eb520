#pragma once

#include <string>

namespace ventras {

/// The PPD of a PostScript printer that may have a duplexer and up to two trays; it says that it has none of
/// them.
inline std::string postScriptPpd() {
    return R"ppd(*PPD-Adobe: "4.3"
*FormatVersion: "4.3"
*FileVersion: "1.0"
*LanguageVersion: English
*LanguageEncoding: ISOLatin1
*PCFileName: "EXPS9000.PPD"
*Manufacturer: "Example"
*Product: "(Example PS 9000)"
*PSVersion: "(3010.000) 0"
*LanguageLevel: "3"
*ModelName: "Example PS 9000"
*ShortNickName: "Example PS 9000"
*NickName: "Example PS 9000"
*ColorDevice: False
*FileSystem: False
*OpenUI *PageSize: PickOne
*DefaultPageSize: A4
*PageSize A4/A4: "<</PageSize[595 842]>>setpagedevice"
*?PageSize: "(A4) = flush"
*CloseUI: *PageSize
*OpenUI *PageRegion: PickOne
*DefaultPageRegion: A4
*PageRegion A4/A4: "<</PageSize[595 842]>>setpagedevice"
*CloseUI: *PageRegion
*DefaultImageableArea: A4
*ImageableArea A4: "0 0 595 842"
*DefaultPaperDimension: A4
*PaperDimension A4: "595 842"
*OpenGroup: InstallableOptions/Installed
*OpenUI *Duplexer/Duplexer: Boolean
*DefaultDuplexer: False
*Duplexer True/Installed: ""
*Duplexer False/Not installed: ""
*?Duplexer: "duplexerInstalled {(True)} {(False)} ifelse = flush"
*CloseUI: *Duplexer
*OpenUI *Trays/Trays: PickOne
*DefaultTrays: None
*Trays None/None: ""
*Trays One/One: ""
*Trays Two/Two: ""
*?Trays: "
  save
    [(None) (One) (Two)] trays get = flush
  restore
"
*End
*CloseUI: *Trays
*OpenUI *Stapler/Stapler: Boolean
*DefaultStapler: False
*Stapler True/Installed: ""
*Stapler False/Not installed: ""
*CloseUI: *Stapler
*CloseGroup: InstallableOptions
)ppd";
}

}  // namespace ventras
