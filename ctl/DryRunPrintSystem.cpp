#include "ctl/DryRunPrintSystem.h"

#include <utility>

namespace ventras {

std::vector<PlannedQueue> DryRunPrintSystem::takePlannedQueues() {
    return std::exchange(planned_, {});
}

std::optional<std::string> DryRunPrintSystem::suggestQueueName(const std::string& name, bool unique) {
    return real_.suggestQueueName(name, unique);
}

std::optional<std::string> DryRunPrintSystem::copyLocalServerURL() {
    return real_.copyLocalServerURL();
}

std::int32_t DryRunPrintSystem::createQueue(const std::string& /*serverURL*/, const std::string& queueID,
                                            const std::string& attributes,
                                            const std::map<std::string, std::string>& options) {
    planned_.push_back({queueID, attributes, options});
    return PrintSystemStatus::kSuccess;
}

bool DryRunPrintSystem::isFax(const std::string& queueID) {
    return real_.isFax(queueID);
}

bool DryRunPrintSystem::isScanner(const std::string& queueID) {
    return real_.isScanner(queueID);
}

std::optional<std::string> DryRunPrintSystem::copyQueuePPD(const std::string& queueID) {
    return real_.copyQueuePPD(queueID);
}

std::optional<std::string> DryRunPrintSystem::copyLocalizedPPD(const std::string& ppdPath) {
    return real_.copyLocalizedPPD(ppdPath);
}

bool DryRunPrintSystem::useLastPrinterAsCurrentPrinter() {
    return real_.useLastPrinterAsCurrentPrinter();
}

AutoSelectCreation DryRunPrintSystem::autoSelectCreateContext(const std::string& deviceURI) {
    return real_.autoSelectCreateContext(deviceURI);
}

}  // namespace ventras
