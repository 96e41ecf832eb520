#include "devices/TXTQuery.h"

#include "devices/TXTRecord.h"
#include "platform/ServiceRecord.h"

namespace ventras {

std::optional<DeviceDescription> queryTXTRecord(const std::string& registeredName) {
    const auto fullName = ippServiceFullName(registeredName);
    const auto record = fullName ? queryLocalServiceRecord(*fullName, ServiceRecordType::TXT) : std::nullopt;
    return record ? std::optional{dictionaryFromTXTRecord(*record)} : std::nullopt;
}

}  // namespace ventras
