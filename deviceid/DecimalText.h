#pragma once

#include <cstdint>
#include <string_view>

namespace ventras {

/// The decimal integer that a text begins with, after white space and a sign. Text that begins with none
/// gives 0; one that is too large or too small gives the nearest that fits. Any thread may call.
std::int64_t leadingInteger64(std::string_view text);
std::int32_t leadingInteger32(std::string_view text);

}  // namespace ventras
