#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "platform/linux/installer/DBusSubscription.h"
#include "platform/linux/installer/EventContext.h"
#include "platform/linux/installer/InstallEnd.h"
#include "platform/linux/installer/PackageID.h"

namespace ventras {

/// A package that a transaction told of.
struct ReportedPackage {
    std::uint32_t info;  ///< PkInfoEnum: what it is, or what becomes of it
    PackageID id;
};

/// A licence that has to be agreed to before a package is installed.
struct PackageLicence {
    std::string id;  ///< PackageKit's, for the agreement
    std::string vendor;
    std::string text;
};

/// What a transaction told until it ended.
struct TransactionResult {
    InstallEnd end;
    std::vector<ReportedPackage> packages{};
    std::vector<PackageLicence> licences{};
    bool forbadeCancel = false;  ///< at some time: the package manager was at work

    /// Whether it told this of a package.
    bool reports(std::uint32_t info, std::string_view name, std::string_view version) const;
};

/// How long a transaction may take.
struct TransactionLimits {
    std::chrono::milliseconds answer;   ///< until a call is answered
    std::chrono::milliseconds silence;  ///< between two signs of life
    std::chrono::milliseconds total;
};

/// How far a transaction is.
struct TransactionProgress {
    std::uint32_t status = 0;                   ///< PkStatusEnum
    std::optional<std::uint32_t> percent = {};  ///< absent when it is not known

    bool operator==(const TransactionProgress&) const = default;
};

/// One transaction of PackageKit (org.freedesktop.PackageKit.Transaction), from its beginning to its end.
///
/// It is never cancelled while PackageKit forbids that: in the middle of a package manager's run a
/// cancellation would leave packages half installed. One that goes silent is cancelled as soon as that is
/// allowed, and left to itself when its time is over. It belongs to the thread of the EventContext.
class PackageKitTransaction {
public:
    using ProgressHandler = std::function<void(const TransactionProgress&)>;

    /// @param connection to the system bus
    PackageKitTransaction(const DBusConnection& connection, EventContext& events, TransactionLimits limits,
                          ProgressHandler onProgress = {});

    /// Runs a role, such as "Resolve"; one for each object.
    /// @param arguments of the role, a tuple; a floating reference is consumed
    TransactionResult run(const char* role, GVariant* arguments);

private:
    bool create();
    DBusAnswer callTransaction(const char* method, GVariant* arguments);
    void follow(Deadline giveUp);
    void cancelWhereAllowed();
    bool isCancelAllowed() const;

    void onSignal(std::string_view member, GVariant* arguments);
    void onFinished(InstallEnd end);
    void onPropertiesChanged(GVariant* arguments);
    void failUnlessEnded(InstallFailure failure, std::string reason);

    const DBusConnection& connection_;
    EventContext& events_;
    TransactionLimits limits_;
    ProgressHandler onProgress_;

    std::string path_;
    std::optional<DBusService> service_;
    std::optional<DBusSubscription> signals_;
    std::optional<DBusSubscription> properties_;

    TransactionResult result_;
    TransactionProgress progress_;
    std::uint32_t error_ = 0;
    std::string reason_;
    bool isFinished_ = false;
    bool wasCancelledByUs_ = false;
    unsigned signsOfLife_ = 0;
};

}  // namespace ventras
