#pragma once

#include <cups/cups.h>

#include <optional>
#include <string>

namespace ventras {

/// The services that one printing device offers over IPP.
enum class PrinterService { Print, FaxOut };

/// Where an IPP service of a device is reached.
struct PrinterAddress {
    std::string host;
    int port = 0;
    std::string resource;  ///< decoded path, beginning with "/"
    http_encryption_t encryption = HTTP_ENCRYPTION_IF_REQUESTED;
    std::string uri;  ///< as the printer knows itself, for "printer-uri"

    /// Finds the service behind a device URI. "ippusb" names a DNS-SD service of this computer, which is
    /// looked up and takes up to 3 s; "ipp" and "ipps" URIs tell it all. Any thread may call.
    /// @return absent for a URI that does not parse, and for a DNS-SD service that does not answer.
    static std::optional<PrinterAddress> find(const std::string& deviceURI, PrinterService service);
};

}  // namespace ventras
