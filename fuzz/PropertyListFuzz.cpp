#include <cstddef>
#include <cstdint>
#include <string_view>

#include "fuzz/Require.h"
#include "platform/PropertyList.h"

// Property lists come out of files that others write: preferences, driver catalogues. What can be read can be
// written, unless it holds what has no place in XML, and is the same when it is read again.

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using namespace ventras;
    const auto value = parsePropertyList({reinterpret_cast<const char*>(data), size});
    const auto text = value ? xmlPropertyList(*value) : std::nullopt;
    require(!text || parsePropertyList(*text) == value);
    return 0;
}
