#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "deviceid/PMDictionaryAdditions.h"
#include "devices/VentrasPrinterObject.h"

namespace ventras {

class PPDManager;
struct Platform;

/// A network printer named by an "ipp://" or "ipps://" URI, which needs no driver of its own.
///
/// It asks the printer at most once for its description, with one IPP Get-Printer-Attributes request (RFC
/// 8011 section 4.2.5), when the description is first needed. One thread at a time.
class VellumProfilePrinterObject final : public VentrasPrinterObject {
public:
    static constexpr std::string_view kBrowserIdentifier = "Vellum Profile";

    VellumProfilePrinterObject(Platform& platform, PPDManager& drivers, std::optional<std::string> uri);

    static std::shared_ptr<VellumProfilePrinterObject> initVellumProfilePrinterObjectWithURI(
        Platform& platform, PPDManager& drivers, std::string uri);

    const std::optional<std::string>& uri() const { return uri_; }

    /// The printer's description; asks the printer when there is none yet. Empty when the printer did not
    /// answer.
    const DeviceDescription& attributes();
    void setAttributes(DeviceDescription attributes);

    /// Asks the printer and replaces the description.
    void updateAttributes();

    std::optional<std::string> name() override;  ///< its DNS-SD service name, else its make and model
    std::optional<std::string> location();
    std::optional<std::string> uuid();
    std::optional<std::string> urf();  ///< its URF capabilities, joined with ","
    std::optional<std::string> product();
    std::optional<std::vector<std::string>> pdl();  ///< MIME types it takes, in lower case
    std::optional<std::string> duplex();            ///< "T" or "F"

    std::string_view browserIdentifier() const { return kBrowserIdentifier; }
    bool selectStandardDefaults() const { return false; }
    bool canDetermineDriver() const { return true; }
    std::vector<PPDRecord> matchPPDBasedDrivers() const { return {}; }

    std::optional<std::string> deviceURI() override { return uri_; }
    std::optional<std::vector<PPDRecord>> driverList() override;
    bool matchesIDDevice(const ImageDevice& device) override;
    std::optional<std::string> matchExistingQueues(const QueueRecords& queues) override;
    std::optional<QueueAttributes> driverInfo(const PPDRecord& driver) override;
    std::optional<std::string> difficulty() override;

    /// For log lines.
    std::string description();

private:
    std::optional<std::string> attribute(std::string_view key);

    Platform& platform_;
    PPDManager& drivers_;
    std::optional<std::string> uri_;
    std::optional<DeviceDescription> attributes_;
    std::string failure_;  // why the printer gave no description
};

}  // namespace ventras
