#include <fcntl.h>

#include <cstdio>
#include <optional>
#include <string>
#include <utility>

#include "devices/IPPUSBObject.h"
#include "platform/ComputerName.h"
#include "platform/Platform.h"
#include "platform/PrintSystemService.h"
#include "queues/QueueMaker.h"

namespace ventras {
namespace {

// The new name can be foreseen by whoever sees the old one, so nothing that is there already is written to,
// followed or replaced.
std::optional<TemporaryFile> movedToNewName(TemporaryFile file, const std::string& path) {
    if (renameat2(AT_FDCWD, file.path().c_str(), AT_FDCWD, path.c_str(), RENAME_NOREPLACE) != 0)
        return std::nullopt;
    file.release();
    return TemporaryFile::adopt(path);
}

}  // namespace

std::int32_t QueueMaker::createQueue(IPPUSBObject& printer) {
    auto made = createDriverlessQueue(printer);
    if (made.ppd && printer.supportsFax() &&
        !printer.matchExistingFaxQueue(inventory_.existingQueues().value_or(QueueRecords{})))
        createFaxQueue(printer, std::move(made.attributes), std::move(*made.ppd));
    return made.status;
}

// The printer queue is there already: whatever becomes of the fax queue changes nothing about that.
void QueueMaker::createFaxQueue(IPPUSBObject& printer, QueueAttributes attributes, TemporaryFile ppd) {
    const auto faxPath = ppd.path() + std::string(AutoSelectContext::kFaxPPDEnding);
    const auto faxPPD = movedToNewName(std::move(ppd), faxPath);
    if (!faxPPD)
        return;
    const auto options =
        applyInstallableOptions(printer.deviceURI().value_or(""), faxPPD->path(), Channel::Binary);
    if (options.status != 0 || !options.newPPD)
        return;
    attributes.insert_or_assign(std::string(QueueAttributeKeys::kPPD), options.newPPD->path());
    creation_.createQueue(platform_.computerName.computerName(), attributes, DefaultPrinter::Keep, printer);
}

}  // namespace ventras
