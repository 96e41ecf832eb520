#pragma once

#include <cups/http.h>

#include <string>

namespace ventras {

/// The parts of a URI (RFC 3986), percent-escapes decoded, as libcups tells them. A value.
struct SeparatedURI {
    /// Takes a URI to pieces, of 1,023 bytes at most: what is longer is cut. Any thread may call.
    static SeparatedURI from(const std::string& uri);

    /// Negative when it is none; above OK when it lacks something.
    http_uri_status_t status = HTTP_URI_STATUS_OK;
    std::string scheme, user, host, resource;
    int port = 0;  ///< the scheme's own where the URI names none
};

}  // namespace ventras
