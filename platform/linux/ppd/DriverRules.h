#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

class PpdFile;

/// What a queue is for, as far as its driver is concerned.
enum class DriverKind {
    Driverless,   ///< for a printer that speaks IPP itself: nothing but the stock converters
    Catalogue,    ///< from the scheduler's own catalogue: any installed filter
    ScannerOnly,  ///< no printing: no filters at all
};

/// Why a PPD must not become the driver of a queue of this kind; absent when it may. A filter line is code
/// that the scheduler runs, and the rest of a PPD holds texts from devices: a line that a text smuggled in
/// ends here.
std::optional<std::string> objectionToDriver(const PpdFile& ppd, DriverKind kind);

/// Why a PPD must not replace the present driver of a queue; absent when it may. It may drop filters, not add
/// any.
std::optional<std::string> objectionToReplacement(const PpdFile& present, const PpdFile& replacement);

}  // namespace ventras
