#pragma once

#include <span>
#include <string>
#include <string_view>

#include "ctl/Value.h"

namespace ventras {

/// One column of a table: the member that it shows, and what it is called.
struct Column {
    std::string_view key, heading;
};

/// Rows of objects for people, columns as wide as their widest value. Values come from devices: what would
/// steer a terminal is shown as U+FFFD.
std::string textTable(const Array& rows, std::span<const Column> columns);

/// One object for people: a line for each member, "-" for what is not known.
std::string textLines(const Object& object);

/// One value for people, on one line.
std::string textOf(const Value& value);

}  // namespace ventras
