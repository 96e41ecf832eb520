#include "deviceid/DecimalText.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <system_error>

#include "deviceid/TextScan.h"

namespace ventras {

std::int64_t leadingInteger64(std::string_view text) {
    text = TextScan::trimmedOfLineEnds(text);
    if (text.starts_with('+') && !text.starts_with("+-"))
        text.remove_prefix(1);
    std::int64_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error == std::errc::result_out_of_range)
        return text.starts_with('-') ? std::numeric_limits<std::int64_t>::min()
                                     : std::numeric_limits<std::int64_t>::max();
    return value;
}

std::int32_t leadingInteger32(std::string_view text) {
    using Limits = std::numeric_limits<std::int32_t>;
    return static_cast<std::int32_t>(
        std::clamp<std::int64_t>(leadingInteger64(text), Limits::min(), Limits::max()));
}

}  // namespace ventras
