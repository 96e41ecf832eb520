#pragma once

#include <map>
#include <string>
#include <vector>

#include "platform/PrintSystemService.h"

namespace ventras {

/// A queue that would have been made.
struct PlannedQueue {
    std::string queueID;
    std::string attributes;  ///< as createQueue() takes them: an XML property list
    std::map<std::string, std::string> options;
};

/// Answers questions as the real print system does, and changes nothing: what it is told to make it notes,
/// and says that it is done. One thread at a time.
class DryRunPrintSystem final : public PrintSystemService {
public:
    explicit DryRunPrintSystem(PrintSystemService& real) : real_(real) {}

    /// The queues since the last call.
    std::vector<PlannedQueue> takePlannedQueues();

    std::optional<std::string> suggestQueueName(const std::string& name, bool unique) override;
    std::optional<std::string> copyLocalServerURL() override;
    std::int32_t createQueue(const std::string& serverURL, const std::string& queueID,
                             const std::string& attributes,
                             const std::map<std::string, std::string>& options) override;
    std::int32_t removeQueue(const std::string&) override { return PrintSystemStatus::kSuccess; }
    std::int32_t setDefaultPrinter(const std::string&) override { return PrintSystemStatus::kSuccess; }
    bool isFax(const std::string& queueID) override;
    bool isScanner(const std::string& queueID) override;
    std::optional<std::string> copyQueuePPD(const std::string& queueID) override;
    std::int32_t setQueuePPD(const std::string&, const std::string&) override {
        return PrintSystemStatus::kSuccess;
    }
    std::optional<std::string> copyLocalizedPPD(const std::string& ppdPath) override;
    bool useLastPrinterAsCurrentPrinter() override;
    AutoSelectCreation autoSelectCreateContext(const std::string& deviceURI) override;

private:
    PrintSystemService& real_;
    std::vector<PlannedQueue> planned_;
};

}  // namespace ventras
