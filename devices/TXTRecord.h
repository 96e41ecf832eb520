#pragma once

#include <string_view>

#include "deviceid/PMDictionaryAdditions.h"

namespace ventras {

/// The keys and values of a DNS-SD TXT record (RFC 6763 section 6). Keys keep their spelling; of several
/// items of one key the last counts. Items without a value, with an empty one or with one that is not UTF-8
/// are left out; an item that cannot be read ends the walk. Any thread may call.
/// @param record the record's raw bytes
DeviceDescription dictionaryFromTXTRecord(std::string_view record);

}  // namespace ventras
