#pragma once

namespace ventras {

/// The program's exit statuses.
enum class Exit { Success = 0, NotFound = 1, Usage = 2, Unreachable = 3 };

}  // namespace ventras
