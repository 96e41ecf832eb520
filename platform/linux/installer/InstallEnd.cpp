#include "platform/linux/installer/InstallEnd.h"

#include <array>
#include <utility>

namespace ventras {
namespace {

// PkExitEnum.
constexpr std::uint32_t kSuccess = 1;
constexpr std::uint32_t kCancelled = 3;
constexpr std::uint32_t kEulaRequired = 5;
constexpr std::uint32_t kNeedUntrusted = 8;
constexpr std::uint32_t kCancelledPriority = 9;

// PkErrorEnum: 0 is no reason, and 1, out of memory, would be taken for an exit status that means something
// else.
constexpr std::uint32_t kFirstReason = 2;
constexpr auto kFirstOwnFailure = static_cast<std::uint32_t>(InstallFailure::Unknown);

/// What an exit means where no error is told.
struct ReasonOfExit {
    std::uint32_t exit, error;
};
constexpr std::array kReasonsOfExits{ReasonOfExit{kEulaRequired, PackageKitError::kNoLicenceAgreement},
                                     ReasonOfExit{kNeedUntrusted, PackageKitError::kUntrusted}};

std::uint32_t reasonOf(std::uint32_t exit, std::uint32_t error) {
    if (error >= kFirstReason && error < kFirstOwnFailure)
        return error;
    for (const auto& entry : kReasonsOfExits)
        if (entry.exit == exit)
            return entry.error;
    return kFirstOwnFailure;
}

}  // namespace

InstallEnd endOfTransaction(std::uint32_t exit, std::uint32_t error, std::string reason) {
    if (exit == kSuccess)
        return InstallEnd::completed();
    if (exit == kCancelled || exit == kCancelledPriority)
        return InstallEnd::cancelled(std::move(reason));
    return {InstallEnd::Kind::Failed, reasonOf(exit, error), std::move(reason)};
}

}  // namespace ventras
