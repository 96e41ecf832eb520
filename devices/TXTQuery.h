#pragma once

#include <optional>
#include <string>

#include "deviceid/PMDictionaryAdditions.h"

namespace ventras {

/// What an IPP-over-USB printer tells about itself in DNS-SD: the TXT record of the service
/// "NAME._ipp._tcp.local." that is registered on this machine. Any thread may call; it blocks for about 3
/// seconds at the most.
/// @return an empty dictionary for a record without readable values; absent when nobody answers, or there is
/// no such service.
std::optional<DeviceDescription> queryTXTRecord(const std::string& registeredName);

}  // namespace ventras
