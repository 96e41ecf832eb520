#include "platform/linux/installer/LinuxPredicateInstallController.h"

#include <glib.h>

#include <utility>
#include <vector>

#include "catalogue/DriverCatalogue.h"
#include "deviceid/PMStringAdditions.h"
#include "platform/Log.h"
#include "platform/linux/DataFolder.h"
#include "platform/linux/installer/DialogPrompter.h"
#include "platform/linux/installer/NotificationPrompter.h"
#include "platform/linux/installer/PackageInstaller.h"
#include "platform/linux/installer/PrompterChain.h"
#include "platform/linux/installer/TerminalPrompter.h"

namespace ventras {
namespace {

std::unique_ptr<Prompter> usualPrompter(EventContext& events) {
    std::vector<std::unique_ptr<Prompter>> prompters;
    prompters.push_back(std::make_unique<NotificationPrompter>(events));
    prompters.push_back(std::make_unique<DialogPrompter>(events));
    prompters.push_back(std::make_unique<TerminalPrompter>(events));
    return std::make_unique<PrompterChain>(std::move(prompters));
}

std::vector<std::string> deviceNames(const PropertyDictionary& printers) {
    std::vector<std::string> names;
    const auto entry = printers.find(InstalledPrintersKeys::kPrinters);
    const auto* scanIDs = entry == printers.end() ? nullptr : std::get_if<PropertyArray>(&entry->second);
    if (scanIDs == nullptr)
        return names;
    for (const auto& scanID : *scanIDs)
        if (const auto* text = std::get_if<std::string>(&scanID))
            names.push_back(PMStringAdditions::deviceName(*text));
    return names;
}

}  // namespace

LinuxPredicateInstallController::LinuxPredicateInstallController(Log& log, const StringTable& strings)
    : LinuxPredicateInstallController(log, strings, {}) {}

LinuxPredicateInstallController::LinuxPredicateInstallController(Log& log, const StringTable& strings,
                                                                 Parts parts)
    : log_(log), strings_(strings), parts_(std::move(parts)) {}

LinuxPredicateInstallController::~LinuxPredicateInstallController() {
    worker_.request_stop();
    if (worker_.joinable())
        worker_.join();
    if (telling_ != nullptr) {
        g_source_destroy(telling_);
        g_source_unref(telling_);
    }
}

void LinuxPredicateInstallController::startWithPredicate(const std::string& predicate,
                                                         bool confirmCompletion) {
    if (isInstalling_) {
        log_.error("no driver package is installed for " + predicate + ": another install goes on");
        return;
    }
    isInstalling_ = true;
    InstallRequest request{predicate, title_, deviceNames(printers_), settings_, confirmCompletion};
    worker_ = std::jthread([this, request = std::move(request)](const std::stop_token& stop) {
        tellLater(install(request, stop));
    });
}

InstallEnd LinuxPredicateInstallController::install(const InstallRequest& request,
                                                    const std::stop_token& stop) const {
    EventContext events(stop);
    const auto prompter = parts_.makePrompter ? parts_.makePrompter(events) : usualPrompter(events);
    auto catalogue = parts_.catalogue ? *parts_.catalogue : locateDataFolder() / DriverCatalogue::kFileName;
    PackageInstaller installer(std::move(catalogue), strings_, *prompter, events,
                               parts_.limits ? *parts_.limits : InstallLimits{});
    auto end = installer.install(request);
    if (!end.isCompleted())
        log_.error("no driver package is installed for " + request.predicate + ": " + end.reason);
    return end;
}

void LinuxPredicateInstallController::tellLater(InstallEnd end) {
    end_ = std::make_unique<InstallEnd>(std::move(end));
    telling_ = g_idle_source_new();
    const auto callBack = [](gpointer self) -> gboolean {
        static_cast<LinuxPredicateInstallController*>(self)->tell();
        return G_SOURCE_REMOVE;
    };
    g_source_set_callback(telling_, callBack, this, nullptr);
    g_source_attach(telling_, g_main_context_default());
}

void LinuxPredicateInstallController::tell() {
    worker_.join();
    g_source_unref(std::exchange(telling_, nullptr));
    isInstalling_ = false;
    const auto end = std::exchange(end_, nullptr);
    if (delegate_ == nullptr)
        return;
    switch (end->kind) {
        case InstallEnd::Kind::Completed:
            return delegate_->predicateInstallDidComplete();
        case InstallEnd::Kind::Cancelled:
            return delegate_->predicateInstallUserDidCancel();
        case InstallEnd::Kind::Failed:
            return delegate_->predicateInstallDidFailWithError(end->code);
    }
}

}  // namespace ventras
