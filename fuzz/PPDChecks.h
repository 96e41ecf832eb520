#pragma once

#include <string_view>

namespace ventras {

/// Requires that every line of a PPD is text: UTF-8 without control characters.
void checkPPDText(std::string_view ppd);

/// Requires that a PPD has the scheduler run nothing but the converters that come with it, by their bare
/// names. It reads the text itself, not what libcups makes of it.
void checkStockFilters(std::string_view ppd);

/// Requires that a PPD has the scheduler run nothing at all.
void checkNoFilters(std::string_view ppd);

}  // namespace ventras
