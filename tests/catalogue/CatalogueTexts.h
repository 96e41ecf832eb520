#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/PropertyValue.h"

namespace ventras {

/// One package as a catalogue file has it.
PropertyDictionary packageEntry(std::int64_t tier, const std::vector<std::string>& tags);

/// What a catalogue file for "debian 12" holds.
PropertyDictionary catalogueContent(PropertyDictionary packages);

/// The text of a property list.
std::string textOf(const PropertyDictionary& content);

/// A catalogue of a LaserJet 4 (collection and driver), a LaserJet 5 (collection), a LaserJet 6 (two drivers)
/// and a Stylus C80 (driver).
std::string smallCatalogue(std::string_view release = "debian 12");

}  // namespace ventras
