#pragma once

#include <string>

#include "ctl/Value.h"
#include "deviceid/PMDictionaryAdditions.h"

namespace ventras {

class VentrasPrinterObject;

/// What is known of one device, and why it is taken for that.
struct Evidence {
    const char* device = nullptr;  ///< name of the device's kind
    Object facts;
};

/// Asks the device where nothing is known of it yet.
Evidence evidenceOf(VentrasPrinterObject& device);

/// The drivers that fit the device, in its own order, each as {"record", "kind", "reason"}.
Array driversFor(VentrasPrinterObject& device);

Object objectOf(const DeviceDescription& description);

}  // namespace ventras
