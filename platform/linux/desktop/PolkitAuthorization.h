#pragma once

#include "platform/AuthorizationService.h"

namespace ventras {

/// Asks polkit, with the right's name as the action and this process as the subject.
///
/// polkit grants everything to uid 0 without looking at its rules, so root is not sent there: the answer is
/// the same and a run starts a few milliseconds earlier. Where polkit does not run, or does not know the
/// action, root and the owner of the scheduler's domain socket are allowed: the latter runs a scheduler of
/// their own. Use it on one thread.
class PolkitAuthorization : public AuthorizationService {
public:
    /// @return 0 when granted, else 77 (EX_NOPERM of sysexits.h).
    std::int32_t create(std::string_view right) override;
};

}  // namespace ventras
