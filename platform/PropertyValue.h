#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace ventras {

struct PropertyValue;
using PropertyArray = std::vector<PropertyValue>;
using PropertyDictionary = std::map<std::string, PropertyValue, std::less<>>;

/// A value as property lists, queue attributes and messages between services hold it: boolean, integer, text,
/// array or dictionary.
struct PropertyValue : std::variant<bool, std::int64_t, std::string, PropertyArray, PropertyDictionary> {
    using variant::variant;
    PropertyValue(const char* text) : variant(std::string(text)) {}
    PropertyValue(std::string_view text) : variant(std::string(text)) {}
};

/// The text under `key`; null when the key is absent or holds something else.
inline const std::string* findText(const PropertyDictionary& dictionary, std::string_view key) {
    const auto entry = dictionary.find(key);
    return entry == dictionary.end() ? nullptr : std::get_if<std::string>(&entry->second);
}

}  // namespace ventras
