#pragma once

#include <chrono>
#include <filesystem>
#include <string>
#include <vector>

#include "platform/PredicateInstallController.h"
#include "platform/linux/installer/InstallPlan.h"
#include "platform/linux/installer/Prompter.h"

namespace ventras {

class StringTable;

/// What is to be installed, and what is said about it.
struct InstallRequest {
    std::string predicate;
    std::string title;                   ///< of the question
    std::vector<std::string> devices{};  ///< names of the devices that it is for
    PredicateInstallSettings settings{};
    bool confirmsCompletion = false;
};

/// How long an install may take.
struct InstallLimits {
    PackageKitLimits packageKit{};
    std::chrono::milliseconds prompt = std::chrono::minutes(10);  ///< for somebody to answer
};

/// One install from the predicate to the packages on disk: finds out what it would do, asks, installs, and
/// looks whether the packages are there.
///
/// Nothing is installed without a yes, nothing that the system does not trust, and nothing that would take
/// other packages away. Packages that an install leaves half installed are taken away again. It belongs to
/// the thread of the EventContext.
class PackageInstaller {
public:
    /// @param catalogue file of the driver packages (docs/driver-catalogue.md)
    PackageInstaller(std::filesystem::path catalogue, const StringTable& strings, Prompter& prompter,
                     EventContext& events, InstallLimits limits = {});

    InstallEnd install(const InstallRequest& request);

private:
    InstallEnd ask(const std::string& title, const std::string& body, const char* yes);
    TransactionResult installPackages(const InstallPlan& plan);
    InstallEnd agreeTo(const std::vector<PackageLicence>& licences);
    InstallEnd verify(const InstallPlan& plan);
    /// @return what is to be said about it, for people
    std::string takeHalfInstalledAway(const InstallPlan& plan);
    void sayHowItEnded(const InstallRequest& request, const InstallEnd& end);

    std::filesystem::path catalogue_;
    const StringTable& strings_;
    Prompter& prompter_;
    InstallLimits limits_;
    PackageKit packageKit_;
    std::string icon_;
};

}  // namespace ventras
