#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "ctl/Json.h"

namespace ventras {

/// The objects of a JSON array; empty when the text is none.
inline std::vector<Object> objectsIn(std::string_view output) {
    const auto value = parseJson(output);
    std::vector<Object> objects;
    if (value && std::holds_alternative<Array>(*value))
        for (const auto& element : std::get<Array>(*value))
            objects.push_back(std::get<Object>(element));
    return objects;
}

/// A member as JSON; "(missing)" when there is none.
inline std::string json(const Object& object, std::string_view key) {
    const auto* member = find(object, key);
    return member == nullptr ? "(missing)" : toJson(*member);
}

}  // namespace ventras
