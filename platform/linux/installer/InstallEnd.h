#pragma once

#include <cstdint>
#include <string>

namespace ventras {

/// Why an install failed where PackageKit gives no reason of its own; fit to be exit statuses, and apart from
/// those that mean something else. PackageKit's reasons keep their numbers, all of them below these.
enum class InstallFailure : std::uint8_t {
    Unknown = 100,             ///< PackageKit failed without a reason
    MalformedPredicate = 101,  ///< the predicate cannot be read
    NamesNoDevice = 102,       ///< it would select packages whatever the device
    NoCatalogue = 103,         ///< the driver-package catalogue is not there, or cannot be used
    NothingSelected = 104,     ///< no package of the catalogue fits
    UnknownPackage = 105,      ///< the package manager does not know the package
    NoPackageKit = 106,        ///< no system bus, no PackageKit on it, or it refuses to talk
    TimedOut = 107,            ///< PackageKit went silent, or took too long
    NotThereAfterwards = 108,  ///< PackageKit tells of success, and the package is not installed
    PackageKitLost = 109,      ///< it went away in the middle
    WouldRemovePackages = 110  ///< the install would take other packages away, or make them older
};

/// PackageKit's own reasons (PkErrorEnum) that are treated specially.
namespace PackageKitError {
inline constexpr std::uint32_t kNoNetwork = 2;
inline constexpr std::uint32_t kPackageDownloadFailed = 10;
inline constexpr std::uint32_t kTransactionError = 16;
inline constexpr std::uint32_t kCannotGetLock = 26;
inline constexpr std::uint32_t kNoLicenceAgreement = 34;
inline constexpr std::uint32_t kRepositoryNotAvailable = 37;
inline constexpr std::uint32_t kNoMoreMirrors = 43;
inline constexpr std::uint32_t kUntrusted = 50;
inline constexpr std::uint32_t kFailedToConfigure = 56;
inline constexpr std::uint32_t kFailedToInstall = 58;
inline constexpr std::uint32_t kCannotFetchSources = 64;
}  // namespace PackageKitError

/// How an install, or a step of it, ended.
struct InstallEnd {
    enum class Kind { Completed, Cancelled, Failed };

    Kind kind = Kind::Completed;
    std::int64_t code = 0;  ///< of a failure: never 0
    std::string reason{};   ///< for people

    static InstallEnd completed() { return {}; }
    static InstallEnd cancelled(std::string reason) { return {Kind::Cancelled, 0, std::move(reason)}; }
    static InstallEnd failed(InstallFailure failure, std::string reason) {
        return {Kind::Failed, static_cast<std::int64_t>(failure), std::move(reason)};
    }

    bool isCompleted() const { return kind == Kind::Completed; }
    bool operator==(const InstallEnd&) const = default;
};

/// The end that PackageKit tells of.
/// @param exit how the transaction finished (PkExitEnum)
/// @param error its reason (PkErrorEnum); 0 = none was given
InstallEnd endOfTransaction(std::uint32_t exit, std::uint32_t error, std::string reason);

}  // namespace ventras
