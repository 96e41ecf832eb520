#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// The data files that come with the print system: generic PPDs, device lists, icons. Any thread may ask.
class ResourceBundle {
public:
    virtual ~ResourceBundle() = default;

    /// The bundle's name, for messages about what is missing from it.
    virtual std::string name() const = 0;

    /// Path of the resource `name` of a type (its file name's extension, without the dot); absent when
    /// missing.
    virtual std::optional<std::string> pathForResource(std::string_view name,
                                                       std::string_view type) const = 0;
};

}  // namespace ventras
