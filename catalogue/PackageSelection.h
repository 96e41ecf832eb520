#pragma once

#include <string_view>
#include <variant>
#include <vector>

#include "catalogue/DriverCatalogue.h"

namespace ventras {

/// Why a predicate selects nothing that may be installed.
enum class SelectionError {
    Malformed = 1,      ///< it is not exactly one condition over tags
    NamesNoDevice = 2,  ///< it holds for packages whatever devices they are for
};

/// For people.
std::string_view describe(SelectionError error);

/// The packages for which a predicate holds, best tier first, then by name; they live as long as the
/// catalogue. None when nothing fits, which is no error.
using PackageSelection = std::variant<DriverCatalogue::Packages, SelectionError>;

/// Evaluates a predicate over the tags of each package, tags of devices being compared by their scanIDKey().
///
/// Device IDs are part of the predicate's text, and a quotation mark in one changes what the text says. So a
/// predicate that would select packages without regard to any device is refused as a whole. Any thread may
/// call.
/// @param predicate as DownloadTriggerOperation writes it; TagPredicate reads it
PackageSelection selectPackages(const DriverCatalogue& catalogue, std::string_view predicate);

}  // namespace ventras
