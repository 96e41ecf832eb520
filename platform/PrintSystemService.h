#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// The print system's own failures. They double as exit statuses, so each has non-zero low eight bits and
/// none is a status of the agent's own; the numbers follow sysexits.h.
namespace PrintSystemStatus {
inline constexpr std::int32_t kSuccess = 0;
inline constexpr std::int32_t kBadData = 65;  ///< queue attributes or PPD that must not reach the scheduler
inline constexpr std::int32_t kUnavailable = 69;   ///< the scheduler, or the printer asked, did not answer
inline constexpr std::int32_t kCannotCreate = 73;  ///< the scheduler refused the queue, or made a raw one
inline constexpr std::int32_t kNoPermission = 77;  ///< the scheduler does not let this user administer it
}  // namespace PrintSystemStatus

/// Longest PPD that is taken for a driver, in bytes. The largest that there are have a few megabytes.
inline constexpr std::size_t kLargestPPD = std::size_t{16} * 1024 * 1024;

/// What auto-selection learnt about a device.
struct AutoSelectInfo {
    std::optional<std::string> product{};  ///< the device's own text, e.g. a PostScript product string
    bool isBinaryOK = false;               ///< whether the channel takes binary data
};

/// One device being asked which driver and which installable options suit it; released with the object.
/// Use it on one thread.
class AutoSelectContext {
public:
    /// A generic PPD whose file name ends so is for the device's fax service, and so is the new one.
    static constexpr std::string_view kFaxPPDEnding = "VellumFax.ppd";

    virtual ~AutoSelectContext() = default;

    /// Asks the device what it is. @return 0 on success.
    virtual std::int32_t autoSelectPPD() = 0;
    virtual AutoSelectInfo autoSelectGetInfo() const = 0;
    virtual void autoSelectSetIsBinaryOK(bool isBinaryOK) = 0;

    /// Finds the installable options of this very device.
    /// @param ppdPath the PPD that the queue would get
    /// @return 0 on success, also when nothing was to be chosen.
    virtual std::int32_t autoSelectInstallableOptions(const std::string& ppdPath) = 0;

    /// "file://" URL of a new PPD with the options chosen; the caller deletes the file. Absent = use the old
    /// one.
    virtual std::optional<std::string> autoSelectHasNewPPD() const = 0;
};

/// A new context, or the status that says why there is none.
struct AutoSelectCreation {
    std::int32_t status = 0;
    std::unique_ptr<AutoSelectContext> context;
};

/// The print system's own queue calls, on the local scheduler. Any thread may call; every call blocks, each
/// request within IppConnection's limits.
class PrintSystemService {
public:
    virtual ~PrintSystemService() = default;

    /// A queue identifier made from a name.
    /// @param unique whether it must differ from every existing queue's
    /// @return absent when the name yields none.
    virtual std::optional<std::string> suggestQueueName(const std::string& name, bool unique) = 0;

    /// The local print server's URL; absent when it cannot be told.
    virtual std::optional<std::string> copyLocalServerURL() = 0;

    /// Creates a queue that is idle and accepts jobs. An existing queue is never changed.
    /// @param serverURL from copyLocalServerURL()
    /// @param queueID from suggestQueueName()
    /// @param attributes QueueAttributes as an XML property list
    /// @param options by QueueOptionKeys
    /// @return 0, or a PrintSystemStatus; the reason is in the system log.
    virtual std::int32_t createQueue(const std::string& serverURL, const std::string& queueID,
                                     const std::string& attributes,
                                     const std::map<std::string, std::string>& options) = 0;

    /// Removes what a failed createQueue() of this object left; refuses any other queue.
    virtual std::int32_t removeQueue(const std::string& queueID) = 0;

    virtual std::int32_t setDefaultPrinter(const std::string& queueID) = 0;
    virtual bool isFax(const std::string& queueID) = 0;
    virtual bool isScanner(const std::string& queueID) = 0;

    /// Copies an existing queue's PPD. @return path of a new temporary file that the caller deletes; absent
    /// when the queue has none, or the scheduler does not hand it out.
    virtual std::optional<std::string> copyQueuePPD(const std::string& queueID) = 0;

    /// Installs a PPD file as an existing queue's driver. @return 0 on success.
    virtual std::int32_t setQueuePPD(const std::string& queueID, const std::string& ppdPath) = 0;

    /// Path of the variant of an installed PPD that is localized for the user; absent when the lookup fails.
    virtual std::optional<std::string> copyLocalizedPPD(const std::string& ppdPath) = 0;

    /// Whether a newly made queue should become the default printer.
    virtual bool useLastPrinterAsCurrentPrinter() = 0;

    /// Opens a device for auto-selection.
    virtual AutoSelectCreation autoSelectCreateContext(const std::string& deviceURI) = 0;
};

}  // namespace ventras
