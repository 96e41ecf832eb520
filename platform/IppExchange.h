#pragma once

#include <string>

#include "platform/IppAnswer.h"

namespace ventras {

/// One IPP request over an open connection, and what came of it.
struct IppExchange {
    IppAnswer answer;
    bool heardNothing = false;  ///< the connection ended before the peer had said a word
};

/// Sends one request and waits for its answer, without any limit of its own: give the connection a guard.
/// Nobody is ever asked for a password. One thread a connection.
/// @param resource path, beginning with "/"
/// @param document descriptor of a file to send after the request; -1 = none
/// @param received descriptor for the document that comes back; -1 = none
IppExchange exchangeOver(http_t* http, ipp_t* request, const std::string& resource, int document,
                         int received);

}  // namespace ventras
