#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ctl/Value.h"
#include "drivers/PPDRecord.h"
#include "platform/PropertyValue.h"

namespace ventras {

Value valueOf(const PropertyValue& property);
Object objectOf(const PropertyDictionary& dictionary);

/// A driver record under its keys; keys of what is not known are left out.
Object objectOf(const PPDRecord& record);

/// The record that a JSON object describes; null members count as left out.
PPDRecord recordFrom(const Object& object);

/// The records of a JSON array. @return absent when the text is no array of objects.
std::optional<std::vector<PPDRecord>> recordsFromJson(std::string_view text);

/// What a kind of driver is, in a few words.
std::string_view describeKind(unsigned kind);

}  // namespace ventras
