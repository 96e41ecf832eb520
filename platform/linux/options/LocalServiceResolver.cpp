#include "platform/linux/options/LocalServiceResolver.h"

#include <strings.h>

#include <algorithm>

#include "platform/ServiceRecord.h"

namespace ventras {

std::optional<LocalService> resolveLocalService(const std::string& name) {
    const auto fullName = ippServiceFullName(name);
    if (!fullName)
        return std::nullopt;
    const auto service = queryLocalServiceRecord(*fullName, ServiceRecordType::SRV);
    const auto port = service ? portInServiceRecord(*service) : std::nullopt;
    if (!port)
        return std::nullopt;
    const auto text = queryLocalServiceRecord(*fullName, ServiceRecordType::TXT).value_or("");
    return LocalService{*port, valueInTextRecord(text, "rp"), valueInTextRecord(text, "rfo"),
                        valueInTextRecord(text, "UUID")};
}

std::optional<std::uint16_t> portInServiceRecord(std::string_view record) {
    constexpr std::size_t kPortOffset = 4;  // after priority and weight
    if (record.size() < kPortOffset + 2)
        return std::nullopt;
    const auto byte = [&](std::size_t i) {
        return static_cast<unsigned>(static_cast<unsigned char>(record[i]));
    };
    const auto port = static_cast<std::uint16_t>(byte(kPortOffset) << 8U | byte(kPortOffset + 1));
    return port == 0 ? std::nullopt : std::optional{port};
}

std::string valueInTextRecord(std::string_view record, std::string_view key) {
    while (!record.empty()) {
        const auto length = static_cast<std::size_t>(static_cast<unsigned char>(record.front()));
        const auto item = record.substr(1, length);  // a last item that is cut short counts as far as it goes
        record.remove_prefix(std::min(length + 1, record.size()));
        const auto equals = item.find('=');
        if (equals == key.size() && strncasecmp(item.data(), key.data(), key.size()) == 0)
            return std::string(item.substr(equals + 1));
    }
    return {};
}

}  // namespace ventras
