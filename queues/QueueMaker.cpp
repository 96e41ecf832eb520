#include "queues/QueueMaker.h"

#include <algorithm>
#include <cstdio>
#include <string_view>
#include <utility>

#include "devices/IPPUSBObject.h"
#include "devices/ScannerObject.h"
#include "devices/USBPrinterObject.h"
#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDKind.h"
#include "drivers/PPDManager.h"
#include "platform/Platform.h"
#include "platform/PrintSystemService.h"
#include "platform/SeparatedURI.h"

namespace ventras {
namespace {

constexpr unsigned kWorstPrinterKind = PPDKind::kInstalledHpijs;

// The URL names a file of this machine: "file:///path" or "file://localhost/path", with percent-escapes.
std::optional<std::string> pathFromFileURL(const std::string& url) {
    const auto parts = SeparatedURI::from(url);
    if (parts.status != HTTP_URI_STATUS_OK || parts.scheme != "file")
        return std::nullopt;
    return parts.resource;
}

}  // namespace

QueueMaker::QueueMaker(Platform& platform, PPDManager& drivers)
    : platform_(platform), drivers_(drivers), inventory_(platform), creation_(platform, inventory_) {}

std::int32_t QueueMaker::createQueueForDevice(VentrasPrinterObject& device) {
    if (auto* printer = dynamic_cast<USBPrinterObject*>(&device))
        return createQueue(*printer);
    if (auto* scanner = dynamic_cast<ScannerObject*>(&device))
        return createQueue(*scanner);
    if (auto* printer = dynamic_cast<IPPUSBObject*>(&device))
        return createQueue(*printer);
    if (auto* printer = dynamic_cast<VellumProfilePrinterObject*>(&device))
        return createQueue(*printer);
    return QueueStatus::kCannotHandle;
}

InstallableOptions QueueMaker::applyInstallableOptions(const std::string& deviceURI,
                                                       const std::string& ppdPath, Channel channel) {
    auto [status, context] = platform_.printSystem.autoSelectCreateContext(deviceURI);
    if (status != 0)
        return {status, std::nullopt};
    std::printf("INFO:Determining printer's features...\n");
    context->autoSelectSetIsBinaryOK(channel == Channel::Binary);
    InstallableOptions options{context->autoSelectInstallableOptions(ppdPath), std::nullopt};
    const auto url = options.status == 0 ? context->autoSelectHasNewPPD() : std::nullopt;
    if (auto path = url ? pathFromFileURL(*url) : std::nullopt)
        options.newPPD = TemporaryFile::adopt(std::move(*path));
    return options;
}

std::optional<PPDRecord> QueueMaker::firstPrinterDriver(
    const std::optional<std::vector<PPDRecord>>& drivers) {
    if (!drivers)
        return std::nullopt;
    const auto isForPrinters = [](const PPDRecord& driver) {
        return PPDManager::ppdKind(driver) <= kWorstPrinterKind && !PPDManager::isFaxPPD(driver);
    };
    const auto driver = std::ranges::find_if(*drivers, isForPrinters);
    return driver == drivers->end() ? std::nullopt : std::optional{*driver};
}

DefaultPrinter QueueMaker::newDefaultPrinter() const {
    return platform_.printSystem.useLastPrinterAsCurrentPrinter() ? DefaultPrinter::BecomesNewQueue
                                                                  : DefaultPrinter::Keep;
}

}  // namespace ventras
