#pragma once

#include <cups/cups.h>
#include <cups/ppd.h>

#include <memory>

namespace ventras {

namespace detail {
struct DeleteIpp {
    void operator()(ipp_t* message) const { ippDelete(message); }
};
struct CloseHttp {
    void operator()(http_t* connection) const { httpClose(connection); }
};
struct ClosePpd {
    void operator()(ppd_file_t* ppd) const { ppdClose(ppd); }
};
struct CloseCupsFile {
    void operator()(cups_file_t* file) const { cupsFileClose(file); }
};
}  // namespace detail

/// Owners of libcups' handles; an empty one is what libcups returns on failure.
using IppPtr = std::unique_ptr<ipp_t, detail::DeleteIpp>;
using HttpPtr = std::unique_ptr<http_t, detail::CloseHttp>;
using PpdPtr = std::unique_ptr<ppd_file_t, detail::ClosePpd>;
using CupsFilePtr = std::unique_ptr<cups_file_t, detail::CloseCupsFile>;

}  // namespace ventras
