#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "devices/TXTRecord.h"
#include "fuzz/Require.h"
#include "platform/Utf8.h"
#include "platform/linux/options/LocalServiceResolver.h"

// A DNS-SD record is whatever somebody registered. It is read as a dictionary, key by key, and as an SRV
// record.

namespace {

using ventras::require;

constexpr std::size_t kLongestItem = 255;

void readAsDictionary(std::string_view record) {
    for (const auto& [key, value] : ventras::dictionaryFromTXTRecord(record)) {
        require(!value.empty() && ventras::isValidUtf8(value));
        require(key.size() + 1 + value.size() <= kLongestItem);
        require(record.find(value) != std::string_view::npos);
    }
}

void readByKey(std::string_view record) {
    for (const char* key : {"rp", "rfo", "UUID", ""})
        require(ventras::valueInTextRecord(record, key).size() <= kLongestItem);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view record{reinterpret_cast<const char*>(data), size};
    readAsDictionary(record);
    readByKey(record);
    require(ventras::portInServiceRecord(record) != 0);
    return 0;
}
