#pragma once

#include "platform/PredicateInstallController.h"

namespace ventras {

class Log;

/// Stands where no installer for driver packages is built in: every install fails at once, with a line in the
/// log that says so. Main thread only.
class UnavailableInstallController : public PredicateInstallController {
public:
    /// @param log outlives the controller
    explicit UnavailableInstallController(Log& log) : log_(log) {}
    ~UnavailableInstallController() override;
    UnavailableInstallController(const UnavailableInstallController&) = delete;
    UnavailableInstallController& operator=(const UnavailableInstallController&) = delete;

    void setDelegate(PredicateInstallDelegate* delegate) override { delegate_ = delegate; }
    void configure(const PredicateInstallSettings&) override {}
    void setTitle(const std::string&) override {}
    void setInstalledPrintersList(const PropertyDictionary&) override {}
    void startWithPredicate(const std::string& predicate, bool confirmCompletion) override;

private:
    Log& log_;
    PredicateInstallDelegate* delegate_ = nullptr;
    unsigned pendingFailure_ = 0;  // GLib's source; 0 = none
};

}  // namespace ventras
