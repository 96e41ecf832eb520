#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// A small PPD that libcups and the scheduler take, with more lines at its end.
std::string ppdWith(std::string_view moreLines);

/// One that prints on a driverless printer.
std::string driverlessPpdText();

/// The PPD of a scanner without a printer.
std::string scannerPpdText(std::string_view name = "Scanner");

}  // namespace ventras
