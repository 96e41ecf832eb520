#include <string>
#include <utility>

#include "devices/ScannerObject.h"
#include "devices/USBPrinterObject.h"
#include "platform/Platform.h"
#include "queues/QueueMaker.h"
#include "queues/ScannerPPDRewrite.h"

namespace ventras {

std::int32_t QueueMaker::createQueue(ScannerObject& scanner) {
    const auto uri = scanner.deviceURI();
    if (!uri)
        return QueueStatus::kCannotHandle;
    QueueCreationResult result{QueueStatus::kAlreadyExists, inventory_.findQueueByDeviceURI(*uri)};
    if (!result.queueID)
        result = scanner.isMFP() ? recordInPrinterQueue(scanner) : createScannerQueue(scanner, *uri);
    if (QueueStatus::isServed(result.status) && result.queueID)
        scanner.setQueueID(std::move(result.queueID));
    return result.status;
}

QueueCreationResult QueueMaker::recordInPrinterQueue(ScannerObject& scanner) {
    const auto printerURI = scanner.printer()->deviceURI();
    auto queueID = printerURI ? inventory_.findQueueByDeviceURI(*printerURI) : std::nullopt;
    if (!queueID || queueID->empty())
        return {QueueStatus::kCannotHandle, std::nullopt};
    rewriteQueuePPDForScanner(platform_.printSystem, queueID, scanner.uuidString(), scanner.modulePath());
    return {QueueStatus::kAlreadyExists, std::move(queueID)};
}

QueueCreationResult QueueMaker::createScannerQueue(ScannerObject& scanner, const std::string& uri) {
    auto ppdPath = scanner.ppdFile();
    if (!ppdPath)
        return {QueueStatus::kCannotHandle, std::nullopt};
    const auto ppd = TemporaryFile::adopt(std::move(*ppdPath));
    const QueueAttributes attributes{
        {std::string(QueueAttributeKeys::kPrinterURI), uri},
        {std::string(QueueAttributeKeys::kPPD), ppd.path()},
        {std::string(QueueAttributeKeys::kScanner), true},
    };
    return creation_.createQueue(scanner.deviceLocation(), attributes, DefaultPrinter::Keep, scanner);
}

}  // namespace ventras
