#pragma once

#include <cstdint>
#include <string_view>

namespace ventras {

/// Decides whether this process may administer printers. One thread at a time; it may block until the user
/// has answered.
class AuthorizationService {
public:
    virtual ~AuthorizationService() = default;

    /// Asks for one right by name, e.g. "system.print.admin"; may ask the user.
    /// @return 0 when granted, else the platform's status, fit to be an exit status.
    virtual std::int32_t create(std::string_view right) = 0;
};

}  // namespace ventras
