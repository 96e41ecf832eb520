#include "platform/linux/installer/PackageInstaller.h"

#include <algorithm>
#include <array>
#include <span>
#include <utility>

#include "platform/StringTable.h"

namespace ventras {
namespace {

constexpr const char* kInstall = "Install";
constexpr const char* kAgree = "Agree";
constexpr const char* kNotNow = "Not Now";
constexpr const char* kInstalling = "Installing printer software...";
constexpr const char* kInstalled = "The printer software is installed.";
constexpr const char* kNotInstalled = "The printer software could not be installed.";
constexpr const char* kDefaultIcon = "printer";

// A package that goes on asking for agreements is not worth it.
constexpr int kMostRoundsOfLicences = 3;

/// Failures in the middle of the package manager's run, where PackageKit does not tell when that begins.
constexpr std::array<std::int64_t, 3> kFailuresThatLeaveTraces{PackageKitError::kTransactionError,
                                                               PackageKitError::kFailedToConfigure,
                                                               PackageKitError::kFailedToInstall};

constexpr std::array<std::int64_t, 2> kNetworkFailures{PackageKitError::kNoNetwork,
                                                       PackageKitError::kPackageDownloadFailed};
constexpr std::array<std::int64_t, 3> kServerFailures{PackageKitError::kRepositoryNotAvailable,
                                                      PackageKitError::kNoMoreMirrors,
                                                      PackageKitError::kCannotFetchSources};
constexpr std::array<std::int64_t, 1> kBusyFailures{PackageKitError::kCannotGetLock};

/// What is said of a failure, by its code; the others share one text.
struct FailureText {
    std::span<const std::int64_t> codes;
    std::string PredicateInstallSettings::*title;
    std::string PredicateInstallSettings::*message;
};
const std::array kFailureTexts{
    FailureText{kNetworkFailures, &PredicateInstallSettings::noNetworkTitle, nullptr},
    FailureText{kServerFailures, &PredicateInstallSettings::noServerTitle, nullptr},
    FailureText{kBusyFailures, &PredicateInstallSettings::busyTitle, &PredicateInstallSettings::busyMessage},
};

bool contains(std::span<const std::int64_t> codes, std::int64_t code) {
    return std::ranges::find(codes, code) != codes.end();
}

// Where the package manager still runs, nothing can be done about what it leaves.
bool mayLeaveTraces(const TransactionResult& result) {
    const auto& end = result.end;
    return !end.isCompleted() && end.code != static_cast<std::int64_t>(InstallFailure::TimedOut) &&
           (result.forbadeCancel || contains(kFailuresThatLeaveTraces, end.code));
}

}  // namespace

PackageInstaller::PackageInstaller(std::filesystem::path catalogue, const StringTable& strings,
                                   Prompter& prompter, EventContext& events, InstallLimits limits)
    : catalogue_(std::move(catalogue)),
      strings_(strings),
      prompter_(prompter),
      limits_(limits),
      packageKit_(events, limits.packageKit) {}

InstallEnd PackageInstaller::install(const InstallRequest& request) {
    icon_ = request.settings.icon.empty() ? kDefaultIcon : request.settings.icon;
    const auto planned = planInstall(catalogue_, request.predicate, packageKit_);
    if (const auto* failure = std::get_if<InstallEnd>(&planned))
        return *failure;
    const auto& plan = std::get<InstallPlan>(planned);
    if (plan.packages.empty())
        return InstallEnd::completed();
    if (auto end = ask(plainText(request.title), offerText(plan.offer(), request.devices), kInstall);
        !end.isCompleted())
        return end;
    const auto result = installPackages(plan);
    auto end = result.end.isCompleted() ? verify(plan) : result.end;
    if (mayLeaveTraces(result))
        end.reason += takeHalfInstalledAway(plan);
    sayHowItEnded(request, end);
    return end;
}

InstallEnd PackageInstaller::ask(const std::string& title, const std::string& body, const char* yes) {
    const InstallQuestion question{title, body, strings_.localizedString(yes),
                                   strings_.localizedString(kNotNow), icon_};
    switch (prompter_.ask(question, Deadline::after(limits_.prompt))) {
        case PromptAnswer::Yes:
            return InstallEnd::completed();
        case PromptAnswer::No:
            return InstallEnd::cancelled("the user does not want it");
        case PromptAnswer::Unanswered:
            return InstallEnd::cancelled("nobody answered");
        case PromptAnswer::NotAsked:
            break;
    }
    return InstallEnd::cancelled("there is nobody to ask");
}

TransactionResult PackageInstaller::installPackages(const InstallPlan& plan) {
    const auto text = strings_.localizedString(kInstalling);
    prompter_.showProgress(text, std::nullopt);
    const auto show = [&](const TransactionProgress& progress) {
        prompter_.showProgress(text, progress.percent);
    };
    auto result = packageKit_.install(plan.ids(), show);
    for (int i = 0; i < kMostRoundsOfLicences && !result.end.isCompleted() && !result.licences.empty(); ++i) {
        if (auto end = agreeTo(result.licences); !end.isCompleted())
            return {std::move(end)};
        result = packageKit_.install(plan.ids(), show);
    }
    return result;
}

InstallEnd PackageInstaller::agreeTo(const std::vector<PackageLicence>& licences) {
    for (const auto& licence : licences) {
        if (auto end = ask(plainText(licence.vendor), plainLines(licence.text), kAgree); !end.isCompleted())
            return end;
        if (auto accepted = packageKit_.acceptLicence(licence.id); !accepted.end.isCompleted())
            return accepted.end;
    }
    return InstallEnd::completed();
}

InstallEnd PackageInstaller::verify(const InstallPlan& plan) {
    const auto installed = packageKit_.resolveInstalled(plan.names());
    if (!installed.end.isCompleted())
        return installed.end;
    for (const auto& package : plan.packages)
        if (!installed.reports(PackageInfo::kInstalled, package.id.name, package.id.version))
            return InstallEnd::failed(InstallFailure::NotThereAfterwards,
                                      "the package " + package.id.name + " is not there afterwards");
    return InstallEnd::completed();
}

// Half installed, a package counts as not installed, and holds up everything that is installed later.
std::string PackageInstaller::takeHalfInstalledAway(const InstallPlan& plan) {
    std::vector<std::string> names;
    for (const auto& id : plan.arriving)
        names.push_back(id.name);
    const auto installed = packageKit_.resolveInstalled(names);
    std::vector<std::string> half;
    for (const auto& id : plan.arriving)
        if (!installed.reports(PackageInfo::kInstalled, id.name, id.version))
            half.push_back(id.asInstalled());
    if (!installed.end.isCompleted() || half.empty())
        return {};
    const auto removal = packageKit_.remove(half).end;
    return removal.isCompleted() ? "" : "; what is half installed could not be removed: " + removal.reason;
}

void PackageInstaller::sayHowItEnded(const InstallRequest& request, const InstallEnd& end) {
    if (end.kind == InstallEnd::Kind::Cancelled)
        return prompter_.finish({}, {});
    if (end.isCompleted())
        return prompter_.finish(request.confirmsCompletion ? strings_.localizedString(kInstalled) : "", {});
    for (const auto& [codes, title, message] : kFailureTexts)
        if (contains(codes, end.code))
            return prompter_.finish(request.settings.*title,
                                    message == nullptr ? std::string() : request.settings.*message);
    prompter_.finish(strings_.localizedString(kNotInstalled), plainText(end.reason));
}

}  // namespace ventras
