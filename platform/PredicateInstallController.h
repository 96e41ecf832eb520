#pragma once

#include <cstdint>
#include <string>

#include "platform/PropertyValue.h"

namespace ventras {

/// Hears how a software-update install ended; called on the main thread.
class PredicateInstallDelegate {
public:
    virtual ~PredicateInstallDelegate() = default;

    virtual void predicateInstallDidComplete() = 0;
    virtual void predicateInstallUserDidCancel() = 0;
    /// @param code the error's code, fit to be an exit status
    virtual void predicateInstallDidFailWithError(std::int64_t code) = 0;
};

/// What the installer's user interface shows and demands; set once.
struct PredicateInstallSettings {
    std::string icon;
    std::string noNetworkTitle;
    std::string noNetworkMessage;
    std::string noServerTitle;
    std::string busyTitle;
    std::string busyMessage;
    int legalTextType = 0;
    std::string helpAnchor;
    bool requiresLicenceAgreement = false;
};

/// Keys of what the installer is told of the printers that software is wanted for; both are arrays of texts.
namespace InstalledPrintersKeys {
inline constexpr const char* kPrinters = "InstalledPrinters";  ///< "MANUFACTURER:make;MODEL:model" of each
inline constexpr const char* kManufacturers = "Manufacturers";
}  // namespace InstalledPrintersKeys

/// Offers the software-update packages whose tags match a predicate, and installs them. Main thread only.
class PredicateInstallController {
public:
    virtual ~PredicateInstallController() = default;

    /// @param delegate not owned; outlives the install
    virtual void setDelegate(PredicateInstallDelegate* delegate) = 0;
    virtual void configure(const PredicateInstallSettings& settings) = 0;
    virtual void setTitle(const std::string& title) = 0;
    /// @param printers by InstalledPrintersKeys
    virtual void setInstalledPrintersList(const PropertyDictionary& printers) = 0;

    /// Asks the user and installs; returns at once, the delegate hears the end.
    /// @param predicate text over a package's tags, parsed here
    /// @param confirmCompletion whether to tell the user about a successful end
    virtual void startWithPredicate(const std::string& predicate, bool confirmCompletion) = 0;
};

}  // namespace ventras
