#pragma once

#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <thread>

#include "platform/PredicateInstallController.h"

struct _GSource;

namespace ventras {

class EventContext;
class Log;
class Prompter;
class StringTable;
struct InstallEnd;
struct InstallLimits;
struct InstallRequest;

/// Installs driver packages through PackageKit, after it has asked by a desktop notification, a window, or
/// the terminal, whichever it finds first; where nobody can be asked, that is a cancellation.
///
/// Main thread only. An install runs on a thread of its own, and its end is told from the main thread's run
/// loop. One install goes on at a time: another that is started meanwhile is not, and the log says so.
class LinuxPredicateInstallController : public PredicateInstallController {
public:
    /// What tests replace.
    struct Parts {
        std::optional<std::filesystem::path> catalogue{};  ///< absent: the one among the program's data
        std::function<std::unique_ptr<Prompter>(EventContext&)> makePrompter{};  ///< empty: as above
        std::shared_ptr<const InstallLimits> limits{};                           ///< null: the usual ones
    };

    /// @param log, strings outlive the controller
    LinuxPredicateInstallController(Log& log, const StringTable& strings);
    LinuxPredicateInstallController(Log& log, const StringTable& strings, Parts parts);
    LinuxPredicateInstallController(const LinuxPredicateInstallController&) = delete;
    LinuxPredicateInstallController& operator=(const LinuxPredicateInstallController&) = delete;

    /// Waits for nothing: an install in PackageKit's hands goes on there.
    ~LinuxPredicateInstallController() override;

    void setDelegate(PredicateInstallDelegate* delegate) override { delegate_ = delegate; }
    void configure(const PredicateInstallSettings& settings) override { settings_ = settings; }
    void setTitle(const std::string& title) override { title_ = title; }
    void setInstalledPrintersList(const PropertyDictionary& printers) override { printers_ = printers; }
    void startWithPredicate(const std::string& predicate, bool confirmCompletion) override;

private:
    InstallEnd install(const InstallRequest& request, const std::stop_token& stop) const;
    void tellLater(InstallEnd end);
    void tell();

    Log& log_;
    const StringTable& strings_;
    Parts parts_;
    PredicateInstallDelegate* delegate_ = nullptr;
    PredicateInstallSettings settings_;
    std::string title_;
    PropertyDictionary printers_;

    bool isInstalling_ = false;
    std::unique_ptr<InstallEnd> end_;  // the worker's, until it has ended
    _GSource* telling_ = nullptr;      // the same
    std::jthread worker_;
};

}  // namespace ventras
