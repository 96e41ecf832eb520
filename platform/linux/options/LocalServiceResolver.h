#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// What DNS-SD (RFC 6763) says of an IPP service that a daemon of this computer has registered.
struct LocalService {
    std::uint16_t port = 0;
    std::string printResource;  ///< TXT "rp", as it stands; empty when absent
    std::string faxResource;    ///< TXT "rfo", the same
    std::string uuid;           ///< TXT "UUID", the same
};

/// Looks up the "_ipp._tcp" service of this name on this computer's own interfaces only. Any thread may call;
/// it blocks for about 3 s when there is no such service.
std::optional<LocalService> resolveLocalService(const std::string& name);

/// The port in an SRV record (RFC 2782); absent when the record is cut short, or says that there is no
/// service.
std::optional<std::uint16_t> portInServiceRecord(std::string_view record);

/// The value under a key of a TXT record (RFC 6763 section 6), the key compared without case; empty when the
/// record has none.
std::string valueInTextRecord(std::string_view record, std::string_view key);

}  // namespace ventras
