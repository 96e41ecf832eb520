#pragma once

#include <span>
#include <string>

#include "devices/VentrasPrinterObject.h"
#include "platform/PredicateInstallController.h"

namespace ventras {

class ResourceBundle;
class StringTable;

/// What the software installer shows and demands, in the user's language.
PredicateInstallSettings installerSettings(const StringTable& strings, const ResourceBundle& resources);

/// The question put to the user before software for these printers is installed.
std::string promptTitle(const StringTable& strings, std::span<const DevicePtr> printers);

}  // namespace ventras
