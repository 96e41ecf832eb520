#include "devices/TXTRecord.h"

#include <dns_sd.h>

#include <array>
#include <cstdint>
#include <limits>
#include <string>

#include "platform/Utf8.h"

namespace ventras {

DeviceDescription dictionaryFromTXTRecord(std::string_view record) {
    DeviceDescription dictionary;
    if (record.empty() || record.size() > std::numeric_limits<std::uint16_t>::max())
        return dictionary;
    const auto length = static_cast<std::uint16_t>(record.size());
    for (std::uint16_t index = 0; index < std::numeric_limits<std::uint16_t>::max(); ++index) {
        std::array<char, 256> key{};
        std::uint8_t valueLength = 0;
        const void* value = nullptr;
        if (TXTRecordGetItemAtIndex(length, record.data(), index, key.size(), key.data(), &valueLength,
                                    &value) != kDNSServiceErr_NoError)
            break;
        if (value == nullptr || valueLength == 0)
            continue;
        const std::string_view text{static_cast<const char*>(value), valueLength};
        if (isValidUtf8(text))
            dictionary.insert_or_assign(key.data(), std::string(text));
    }
    return dictionary;
}

}  // namespace ventras
