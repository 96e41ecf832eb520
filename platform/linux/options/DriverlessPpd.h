#pragma once

#include <string>
#include <variant>

#include "platform/Handles.h"
#include "platform/TemporaryFile.h"
#include "platform/linux/options/PrinterAddress.h"

namespace ventras {

/// Loads what driverlessPPD() needs, which takes a while, so that it can happen while a printer is being
/// waited for. Any thread may call, any number of times.
void loadPPDGenerator();

/// Makes the PPD of one IPP printer with the field's own generator, and checks what comes out. Any thread may
/// call; the generator works for one at a time.
/// @param capabilities from printerCapabilities()
/// @return the file, or why there is none.
std::variant<TemporaryFile, std::string> driverlessPPD(ipp_t* capabilities, PrinterService service);

}  // namespace ventras
