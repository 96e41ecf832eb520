#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace ventras {

/// The records of a DNS-SD service (RFC 6763) that can be asked for, by their DNS type.
enum class ServiceRecordType : std::uint16_t { TXT = 16, SRV = 33 };

/// The full DNS name of the IPP service of this machine that is registered under a name, with all escapes.
/// Any thread may call.
/// @return absent when the name is none that a service can have: empty, or longer than 63 bytes.
std::optional<std::string> ippServiceFullName(const std::string& registeredName);

/// Asks the DNS-SD responder for a record of a service that is registered for this machine alone. Any thread
/// may call; it blocks for little more than 3 seconds at the most, whatever state the responder is in.
/// @param fullName with or without escapes and final dot
/// @return the record's bytes; absent when nobody answers, or there is no such record.
std::optional<std::string> queryLocalServiceRecord(const std::string& fullName, ServiceRecordType type);

}  // namespace ventras
