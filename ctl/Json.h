#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "ctl/Value.h"

namespace ventras {

/// The value as JSON (RFC 8259) on one line. Bytes that are no UTF-8 become U+FFFD.
std::string toJson(const Value& value);

/// Reads one JSON text. @return absent when it is none, or nested absurdly deep.
std::optional<Value> parseJson(std::string_view text);

}  // namespace ventras
