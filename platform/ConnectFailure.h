#pragma once

#include <cups/cups.h>

#include <string>

namespace ventras {

/// Why a connection does not come about, in the system's own words. libcups fails without saying; this tries
/// again, briefly, only to learn the reason.
/// @param addresses those of the peer, tried in turn
/// @return a line for people; also when this attempt gets through, which leaves the conversation that follows
///         a connection, TLS, as the one that failed.
std::string connectFailure(const http_addrlist_t* addresses);

}  // namespace ventras
