#include "platform/linux/installer/PackageKitTransaction.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

namespace ventras {
namespace {

constexpr const char* kService = "org.freedesktop.PackageKit";
constexpr const char* kTransaction = "org.freedesktop.PackageKit.Transaction";
constexpr const char* kProperties = "org.freedesktop.DBus.Properties";
constexpr DBusMethod kCreateTransaction{Bus::System, kService, "/org/freedesktop/PackageKit", kService,
                                        "CreateTransaction"};

constexpr std::uint32_t kWholePercent = 100;
constexpr std::size_t kMostPackages = 10'000;
constexpr std::size_t kMostLicences = 100;

std::string textAt(GVariant* tuple, gsize index) {
    const VariantPtr child{g_variant_get_child_value(tuple, index)};
    return g_variant_get_string(child.get(), nullptr);
}

std::uint32_t numberAt(GVariant* tuple, gsize index) {
    const VariantPtr child{g_variant_get_child_value(tuple, index)};
    return g_variant_get_uint32(child.get());
}

/// The signals that count, and what they must look like: PackageKit runs as root, but not everything that is
/// called PackageKit is it.
struct SignalForm {
    std::string_view name;
    const char* type;
};
constexpr std::array kSignals{SignalForm{"Package", "(uss)"}, SignalForm{"ErrorCode", "(us)"},
                              SignalForm{"EulaRequired", "(ssss)"}, SignalForm{"Finished", "(uu)"},
                              SignalForm{"Destroy", "()"}};

bool isWellFormed(std::string_view member, GVariant* arguments) {
    return std::ranges::any_of(kSignals, [&](const SignalForm& form) {
        return form.name == member && g_variant_is_of_type(arguments, G_VARIANT_TYPE(form.type)) != FALSE;
    });
}

}  // namespace

bool TransactionResult::reports(std::uint32_t info, std::string_view name, std::string_view version) const {
    return std::ranges::any_of(packages, [&](const ReportedPackage& package) {
        return package.info == info && package.id.name == name && package.id.version == version;
    });
}

PackageKitTransaction::PackageKitTransaction(const DBusConnection& connection, EventContext& events,
                                             TransactionLimits limits, ProgressHandler onProgress)
    : connection_(connection), events_(events), limits_(limits), onProgress_(std::move(onProgress)) {}

TransactionResult PackageKitTransaction::run(const char* role, GVariant* arguments) {
    const VariantPtr owner{g_variant_ref_sink(arguments)};
    const auto giveUp = Deadline::after(limits_.total);
    if (!create())
        return std::move(result_);
    // Hints are wishes: a PackageKit that knows none of them works all the same.
    callTransaction("SetHints", g_variant_new_parsed("(['interactive=true', 'background=false'],)"));
    const auto started = callTransaction(role, owner.get());
    if (started.reply)
        follow(giveUp);
    else
        failUnlessEnded(InstallFailure::NoPackageKit, started.failure);
    return std::move(result_);
}

bool PackageKitTransaction::create() {
    const auto created = connection_.call(kCreateTransaction, g_variant_new("()"), "(o)", limits_.answer,
                                          events_.cancellable());
    if (!created.reply) {
        failUnlessEnded(InstallFailure::NoPackageKit, created.failure);
        return false;
    }
    path_ = textAt(created.reply.get(), 0);
    service_.emplace(connection_, kService);
    if (service_->isLost()) {
        failUnlessEnded(InstallFailure::PackageKitLost, "PackageKit went away");
        return false;
    }
    signals_.emplace(connection_, service_->owner(), kTransaction, path_,
                     [this](std::string_view member, GVariant* arguments) { onSignal(member, arguments); });
    properties_.emplace(connection_, service_->owner(), kProperties, path_,
                        [this](std::string_view, GVariant* arguments) { onPropertiesChanged(arguments); });
    return true;
}

DBusAnswer PackageKitTransaction::callTransaction(const char* method, GVariant* arguments) {
    const DBusMethod transactionMethod{Bus::System, service_->owner().c_str(), path_.c_str(), kTransaction,
                                       method};
    return connection_.call(transactionMethod, arguments, "()", limits_.answer, events_.cancellable());
}

void PackageKitTransaction::follow(Deadline giveUp) {
    while (!isFinished_) {
        const auto seen = signsOfLife_;
        const auto silence = Deadline::after(std::min(limits_.silence, giveUp.remaining()));
        const bool moved = events_.waitUntil(
            [&] { return isFinished_ || service_->isLost() || signsOfLife_ != seen; }, silence);
        if (events_.stopRequested())
            return failUnlessEnded(InstallFailure::Unknown, "this program ends");
        if (service_->isLost())
            return failUnlessEnded(InstallFailure::PackageKitLost, "PackageKit went away");
        if (moved && !giveUp.passed())
            continue;
        cancelWhereAllowed();
        if (giveUp.passed() || wasCancelledByUs_)
            return failUnlessEnded(InstallFailure::TimedOut, "PackageKit does not come to an end");
    }
}

void PackageKitTransaction::cancelWhereAllowed() {
    if (!isCancelAllowed())
        return;
    wasCancelledByUs_ = true;
    callTransaction("Cancel", g_variant_new("()"));
    events_.waitUntil([this] { return isFinished_ || service_->isLost(); }, Deadline::after(limits_.answer));
}

// Asked for each time: a signal that came late would have us cancel too late.
bool PackageKitTransaction::isCancelAllowed() const {
    const DBusMethod get{Bus::System, service_->owner().c_str(), path_.c_str(), kProperties, "Get"};
    const auto answer = connection_.call(get, g_variant_new("(ss)", kTransaction, "AllowCancel"), "(v)",
                                         limits_.answer, events_.cancellable());
    if (!answer.reply)
        return false;
    const VariantPtr boxed{g_variant_get_child_value(answer.reply.get(), 0)};
    const VariantPtr value{g_variant_get_variant(boxed.get())};
    return g_variant_is_of_type(value.get(), G_VARIANT_TYPE_BOOLEAN) != FALSE &&
           g_variant_get_boolean(value.get()) != FALSE;
}

void PackageKitTransaction::onSignal(std::string_view member, GVariant* arguments) {
    ++signsOfLife_;
    if (isFinished_ || !isWellFormed(member, arguments))
        return;
    if (member == "Package") {
        auto id = PackageID::parse(textAt(arguments, 1));
        if (id && result_.packages.size() < kMostPackages)
            result_.packages.push_back({numberAt(arguments, 0), std::move(*id)});
    } else if (member == "ErrorCode") {
        error_ = numberAt(arguments, 0);
        reason_ = textAt(arguments, 1);
    } else if (member == "EulaRequired") {
        if (result_.licences.size() < kMostLicences)
            result_.licences.push_back({textAt(arguments, 0), textAt(arguments, 2), textAt(arguments, 3)});
    } else if (member == "Finished") {
        onFinished(endOfTransaction(numberAt(arguments, 0), error_, reason_));
    } else {
        failUnlessEnded(InstallFailure::PackageKitLost, "PackageKit gave the transaction up");
    }
}

void PackageKitTransaction::onFinished(InstallEnd end) {
    if (wasCancelledByUs_ && !end.isCompleted())
        return failUnlessEnded(InstallFailure::TimedOut, "PackageKit went silent, and was cancelled");
    isFinished_ = true;
    result_.end = std::move(end);
}

void PackageKitTransaction::onPropertiesChanged(GVariant* arguments) {
    ++signsOfLife_;
    if (g_variant_is_of_type(arguments, G_VARIANT_TYPE("(sa{sv}as)")) == FALSE)
        return;
    const VariantPtr changed{g_variant_get_child_value(arguments, 1)};
    auto progress = progress_;
    guint32 percent = 0;
    gboolean allowsCancel = TRUE;
    g_variant_lookup(changed.get(), "AllowCancel", "b", &allowsCancel);
    result_.forbadeCancel |= allowsCancel == FALSE;
    g_variant_lookup(changed.get(), "Status", "u", &progress.status);
    if (g_variant_lookup(changed.get(), "Percentage", "u", &percent) != FALSE)
        progress.percent = percent <= kWholePercent ? std::optional<std::uint32_t>{percent} : std::nullopt;
    if (std::exchange(progress_, progress) != progress && onProgress_)
        onProgress_(progress);
}

void PackageKitTransaction::failUnlessEnded(InstallFailure failure, std::string reason) {
    if (std::exchange(isFinished_, true))
        return;
    result_.end = InstallEnd::failed(failure, std::move(reason));
}

}  // namespace ventras
