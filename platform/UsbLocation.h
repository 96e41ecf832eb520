#pragma once

#include <cstdint>
#include <span>

namespace ventras {

/// Where a device sits on the USB, as one number that stays the same for a socket: the bus number in the top
/// byte, then one hexadecimal digit for each hub port on the way, outermost first. Ports beyond the sixth do
/// not fit and are left out.
constexpr std::uint32_t usbLocation(std::uint8_t bus, std::span<const std::uint8_t> ports) {
    std::uint32_t location = std::uint32_t{bus} << 24U;
    unsigned shift = 24;
    for (const std::uint32_t port : ports) {
        if (shift == 0)
            break;
        shift -= 4;
        location |= (port & 15U) << shift;
    }
    return location;
}

}  // namespace ventras
