#pragma once

#include "tests/parts/FakePrinter.h"

namespace ventras {

/// A PostScript printer, and the device URI of its queue.
inline constexpr const char* kPostScriptURI = "usb://Example/PS%209000?serial=A1";

inline FakePrinterModel postScriptModel() {
    FakePrinterModel model;
    model.deviceID = "MFG:Example;MDL:PS 9000;CMD:POSTSCRIPT;SN:A1;";
    return model;
}

}  // namespace ventras
