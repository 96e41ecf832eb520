#pragma once

#include "platform/Handles.h"
#include "platform/linux/options/PrinterAddress.h"

namespace ventras {

/// A printer's description of itself reduced to what a driver is made from: known attributes of the right
/// kind, with plausible numbers, and texts that stay texts when they are written into a PPD. Values that are
/// anything else are left out one by one. Nothing in it has a reader fetch a file from somewhere. Any thread
/// may call.
/// @param description the answer to Get-Printer-Attributes (RFC 8011 section 4.2.5)
/// @param service what the driver is for; only that service's driver is made from the result
/// @return never empty
IppPtr printerCapabilities(ipp_t* description, PrinterService service);

}  // namespace ventras
