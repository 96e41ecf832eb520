#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// The UUID of a name within this system's own namespace (RFC 4122 section 4.3, SHA-1), in lower case: the
/// same for the same name, everywhere and always. Any thread may call.
std::string nameBasedUUID(std::string_view name);

}  // namespace ventras
