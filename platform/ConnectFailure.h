#pragma once

#include <string>

namespace ventras {

/// Why a connection does not come about, in the system's own words. libcups fails without saying; this tries
/// again, briefly, only to learn the reason.
/// @param host a name, an address, or the path of a UNIX socket
/// @return a line for people; also when this attempt gets through, which leaves the conversation that follows
/// a
///         connection, TLS, as the one that failed.
std::string connectFailure(const std::string& host, int port);

}  // namespace ventras
