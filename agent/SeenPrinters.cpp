#include "agent/SeenPrinters.h"

#include "devices/VentrasPrinterObject.h"
#include "platform/PreferenceStore.h"

namespace ventras {

bool SeenPrinters::contains(VentrasPrinterObject& printer) const {
    const auto scanID = printer.softwareUpdateScanDeviceID();
    return !scanID || scanIDs_.contains(*scanID);
}

void SeenPrinters::insert(VentrasPrinterObject& printer) {
    auto scanID = printer.softwareUpdateScanDeviceID();
    if (!scanID)
        return;
    scanIDs_.insert(std::move(*scanID));
    preferences_.setValue(kDomain, kKey, PropertyArray(scanIDs_.begin(), scanIDs_.end()));
}

}  // namespace ventras
