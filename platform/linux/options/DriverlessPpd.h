#pragma once

#include <string>
#include <thread>
#include <variant>

#include "platform/Handles.h"
#include "platform/TemporaryFile.h"
#include "platform/linux/options/PrinterAddress.h"

namespace ventras {

/// Begins to load what driverlessPPD() needs, which takes a while, so that it can happen while printers are
/// being waited for. No thread can be started meanwhile: the loader's lock is in the way. Any thread may
/// call, any number of times.
/// @return the thread that does it; none when that has been begun before.
std::jthread loadPPDGenerator();

/// Makes the PPD of one IPP printer with the field's own generator, and checks what comes out. Any thread may
/// call; the generator works for one at a time.
/// @param capabilities from printerCapabilities()
/// @return the file, or why there is none.
std::variant<TemporaryFile, std::string> driverlessPPD(ipp_t* capabilities, PrinterService service);

}  // namespace ventras
