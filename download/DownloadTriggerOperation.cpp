#include "download/DownloadTriggerOperation.h"

#include <string_view>
#include <utility>

#include "platform/Platform.h"
#include "platform/RunLoop.h"
#include "queues/OperationDelegate.h"

namespace ventras {
namespace {

constexpr std::string_view kPrintingSoftware = "\"printing software\" in tags ";
constexpr std::string_view kPrinterUpdate = "\"printer update\" in tags ";

std::string group(std::string_view expression) {
    return "(" + std::string(expression) + ")";
}

std::string softwareKind() {
    return group(group(kPrintingSoftware) + " OR " + group(kPrinterUpdate));
}

std::string deviceTerm(std::string_view scanID) {
    return group("\"" + std::string(scanID) + "\" IN tags");
}

}  // namespace

std::shared_ptr<DownloadTriggerOperation> DownloadTriggerOperation::downloadTriggerOperationWithDelegate(
    OperationDelegate& delegate, Platform& platform) {
    return std::make_shared<DownloadTriggerOperation>(delegate, platform);
}

DownloadTriggerOperation::DownloadTriggerOperation(OperationDelegate& delegate, Platform& platform)
    : delegate_(delegate), platform_(platform) {}

void DownloadTriggerOperation::main() {
    platform_.runLoop.performOnMainThread([this] { delegate_.operationCompleted(*this); });
}

std::optional<std::string> DownloadTriggerOperation::predicateForUpdateString(const std::string& scanID) {
    return predicateForUpdateStrings(std::span(&scanID, 1));
}

std::optional<std::string> DownloadTriggerOperation::predicateForUpdateStrings(
    std::span<const std::string> scanIDs) {
    std::string terms;
    int count = 0;
    for (const auto& scanID : scanIDs) {
        if (scanID.empty())
            continue;
        terms += (count++ == 0 ? "" : " OR ") + deviceTerm(scanID);
    }
    if (count == 0)
        return std::nullopt;
    return softwareKind() + " AND " + (count == 1 ? terms : group(terms));
}

}  // namespace ventras
