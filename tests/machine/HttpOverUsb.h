#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>

#include "platform/linux/FileDescriptor.h"

namespace ventras {

/// The inside of a printer with IPP over USB: carries what comes over the USB to an IPP printer on this
/// computer, and back. For FakePrinter::http. One thread at a time.
class HttpOverUsb {
public:
    explicit HttpOverUsb(std::uint16_t port) : port_(port) {}

    /// Takes bytes for an interface, perhaps none.
    /// @return what has come back since the last call.
    std::string operator()(std::uint8_t interface, std::string_view data);

private:
    /// Of one interface, which has requests one after the other.
    struct Exchange {
        FileDescriptor connection;
        bool isAnswered = true;
    };

    std::uint16_t port_;
    std::map<std::uint8_t, Exchange> exchanges_;
};

}  // namespace ventras
