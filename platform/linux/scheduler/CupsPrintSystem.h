#pragma once

#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <string_view>

#include "platform/PrintSystemService.h"
#include "platform/linux/scheduler/SchedulerRequest.h"

namespace ventras {

class Log;
class PlistPreferenceStore;
class PpdFile;
class Scheduler;
struct NewQueue;

/// The print system as administration requests to a CUPS scheduler, the one of the user's libcups
/// configuration. Every failure leaves one line in the log. Any thread may call; each call blocks.
class CupsPrintSystem : public PrintSystemService {
public:
    /// The user's wish that each new queue becomes the default printer: a boolean of this domain and key.
    static constexpr std::string_view kPreferenceDomain = "com.quillon.print";
    static constexpr std::string_view kNewestIsDefault = "Newest Printer Is Default";

    /// @param log, preferences outlive the print system
    CupsPrintSystem(Log& log, const PlistPreferenceStore& preferences)
        : log_(log), preferences_(preferences) {}

    std::optional<std::string> suggestQueueName(const std::string& name, bool unique) override;
    std::optional<std::string> copyLocalServerURL() override;
    std::int32_t createQueue(const std::string& serverURL, const std::string& queueID,
                             const std::string& attributes,
                             const std::map<std::string, std::string>& options) override;
    std::int32_t removeQueue(const std::string& queueID) override;
    std::int32_t setDefaultPrinter(const std::string& queueID) override;
    bool isFax(const std::string& queueID) override;
    bool isScanner(const std::string& queueID) override;
    std::optional<std::string> copyQueuePPD(const std::string& queueID) override;
    std::int32_t setQueuePPD(const std::string& queueID, const std::string& ppdPath) override;
    std::optional<std::string> copyLocalizedPPD(const std::string& ppdPath) override;
    bool useLastPrinterAsCurrentPrinter() override;
    AutoSelectCreation autoSelectCreateContext(const std::string& deviceURI) override;

private:
    std::optional<Refusal> create(const NewQueue& queue);
    std::optional<Refusal> createUnchecked(Scheduler& scheduler, const NewQueue& queue, const PpdFile& ppd);
    struct QueueKind {
        bool isFax = false;
        bool isScanner = false;
    };

    std::optional<QueueKind> kindOfOwn(const std::string& queueID);
    void rememberOwn(const std::string& queueID, QueueKind kind);
    void forgetOwn(const std::string& queueID);
    void rememberLeftover(const std::string& queueID);
    bool isLeftover(const std::string& queueID);
    void forgetLeftover(const std::string& queueID);
    std::int32_t report(const std::string& what, const Refusal& refusal);

    Log& log_;
    const PlistPreferenceStore& preferences_;
    std::mutex mutex_;
    std::set<std::string> leftovers_;        // queues of failed creations that may still be there
    std::map<std::string, QueueKind> made_;  // the others, so that nobody need be asked what they are
};

}  // namespace ventras
