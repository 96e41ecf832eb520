#pragma once

#include <string>
#include <vector>

#include "platform/linux/installer/PackageKitTransaction.h"

namespace ventras {

/// How long PackageKit may take.
struct PackageKitLimits {
    std::chrono::milliseconds connect = std::chrono::seconds(5);  ///< to the bus
    TransactionLimits lookUp{std::chrono::seconds(25), std::chrono::minutes(1), std::chrono::minutes(3)};
    /// A password may have to be found, and a slow network can be silent for a while.
    TransactionLimits change{std::chrono::seconds(25), std::chrono::minutes(5), std::chrono::hours(1)};
};

/// The package manager, by way of PackageKit on the system bus. It belongs to the thread of the EventContext.
class PackageKit {
public:
    /// Connects to the bus; without one, everything fails.
    explicit PackageKit(EventContext& events, PackageKitLimits limits = {});

    /// Which of these packages there are for this computer, installed or not.
    TransactionResult resolve(const std::vector<std::string>& names);

    /// Which of them are installed, entirely.
    TransactionResult resolveInstalled(const std::vector<std::string>& names);

    /// What installing them would do.
    TransactionResult simulateInstall(const std::vector<std::string>& ids);

    /// Installs packages that come from where the system trusts, and only those.
    TransactionResult install(const std::vector<std::string>& ids,
                              PackageKitTransaction::ProgressHandler onProgress);

    TransactionResult remove(const std::vector<std::string>& ids);

    TransactionResult acceptLicence(const std::string& licenceID);

private:
    TransactionResult lookUp(const char* role, GVariant* arguments);
    TransactionResult change(const char* role, GVariant* arguments,
                             PackageKitTransaction::ProgressHandler onProgress = {});

    EventContext& events_;
    PackageKitLimits limits_;
    DBusConnection connection_;
};

/// What PackageKit says of packages (PkInfoEnum), as far as it matters here.
namespace PackageInfo {
inline constexpr std::uint32_t kInstalled = 1;
inline constexpr std::uint32_t kAvailable = 2;
inline constexpr std::uint32_t kInstalling = 12;
inline constexpr std::uint32_t kRemoving = 13;
inline constexpr std::uint32_t kObsoleting = 15;
inline constexpr std::uint32_t kDowngrading = 20;
inline constexpr std::uint32_t kUntrusted = 23;
}  // namespace PackageInfo

}  // namespace ventras
