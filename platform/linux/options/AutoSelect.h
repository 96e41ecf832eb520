#pragma once

#include <memory>
#include <string>

#include "platform/PrintSystemService.h"

namespace ventras {

class Log;

/// A context for auto-selection, of the class that serves the device URI's scheme.
/// @param log outlives the context
std::unique_ptr<AutoSelectContext> makeAutoSelectContext(const std::string& deviceURI, Log& log);

}  // namespace ventras
