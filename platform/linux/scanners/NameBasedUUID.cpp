#include "platform/linux/scanners/NameBasedUUID.h"

#include <glib.h>

#include <array>
#include <cstdint>
#include <memory>

namespace ventras {
namespace {

// Drawn once at random for the devices that this system names.
constexpr std::array<std::uint8_t, 16> kNamespace{0x5b, 0x1e, 0x83, 0x0c, 0x2f, 0xd4, 0x4a, 0x67,
                                                  0x9c, 0x31, 0xe2, 0x0b, 0x77, 0xa5, 0x64, 0x1d};

}  // namespace

std::string nameBasedUUID(std::string_view name) {
    const std::unique_ptr<GChecksum, decltype(&g_checksum_free)> checksum{g_checksum_new(G_CHECKSUM_SHA1),
                                                                          &g_checksum_free};
    g_checksum_update(checksum.get(), kNamespace.data(), kNamespace.size());
    g_checksum_update(checksum.get(), reinterpret_cast<const guchar*>(name.data()),
                      static_cast<gssize>(name.size()));
    std::array<guint8, 20> digest{};
    gsize length = digest.size();
    g_checksum_get_digest(checksum.get(), digest.data(), &length);
    digest[6] = static_cast<guint8>((digest[6] & 0x0FU) | 0x50U);  // version 5
    digest[8] = static_cast<guint8>((digest[8] & 0x3FU) | 0x80U);  // the variant of the RFC

    constexpr std::string_view kDigits = "0123456789abcdef";
    std::string text;
    for (std::size_t i = 0; i < 16; ++i) {
        if (i == 4 || i == 6 || i == 8 || i == 10)
            text += '-';
        text += kDigits[digest[i] >> 4U];
        text += kDigits[digest[i] & 15U];
    }
    return text;
}

}  // namespace ventras
