#pragma once

#include <cups/cups.h>

#include <memory>
#include <string>

#include "platform/Deadline.h"

namespace ventras {

namespace detail {
struct FreeAddressList {
    void operator()(http_addrlist_t* list) const { httpAddrFreeList(list); }
};
}  // namespace detail

/// The addresses under which a host may be reached, in the order in which they are tried. A value; use it on
/// one thread.
struct HostAddresses {
    std::unique_ptr<http_addrlist_t, detail::FreeAddressList> list;  ///< empty = none are known
    std::string failure;                                             ///< why, for people

    /// Finds them. A name may have to be asked of name servers, which have limits of their own, longer ones:
    /// the system's resolver is left behind when it does not answer by the deadline.
    /// @param host a name, an IPv4 or IPv6 address without brackets, or the path of a UNIX socket
    static HostAddresses find(const std::string& host, int port, Deadline deadline);
};

}  // namespace ventras
