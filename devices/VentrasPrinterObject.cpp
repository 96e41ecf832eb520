#include "devices/VentrasPrinterObject.h"

#include <utility>

namespace ventras {

std::optional<std::string> VentrasPrinterObject::queueID() const {
    const std::lock_guard lock(mutex_);
    return queueID_;
}

void VentrasPrinterObject::setQueueID(std::optional<std::string> queueID) {
    const std::lock_guard lock(mutex_);
    queueID_ = std::move(queueID);
}

}  // namespace ventras
