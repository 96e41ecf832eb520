#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// Writes a value as an XML property list.
/// @return absent when a text cannot stand in XML: invalid UTF-8, or a control character other than tab and
///         line ends.
std::optional<std::string> xmlPropertyList(const PropertyValue& value);

/// Reads an XML property list.
/// @return absent when it does not parse, is in the binary form, is longer than 4 MiB, or has more than 65536
///         arrays and dictionaries. Dates, data and real numbers are left out of their container.
std::optional<PropertyValue> parsePropertyList(std::string_view data);

}  // namespace ventras
