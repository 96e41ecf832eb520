#include "drivers/TextEncoding.h"

#include <glib.h>

#include <algorithm>
#include <array>
#include <memory>

#include "platform/Utf8.h"

namespace ventras {
namespace {

struct Encoding {
    TextEncoding encoding;
    std::string_view languageEncoding;
    const char* converter;
};

// Drivers say "JIS83-RKSJ" and hold the characters that Microsoft added to Shift JIS, hence its code page.
constexpr std::array kEncodings{
    Encoding{TextEncoding::ISOLatin1, "ISOLatin1", "ISO-8859-1"},
    Encoding{TextEncoding::WindowsCP1252, "WindowsANSI", "CP1252"},
    Encoding{TextEncoding::ShiftJIS, "JIS83-RKSJ", "CP932"},
};

// What all the encodings have in common. The two others are something else in some tables of Shift JIS.
constexpr bool isPlainAscii(char c) {
    const auto byte = static_cast<unsigned char>(c);
    return byte != 0 && byte < 0x80 && c != '\\' && c != '~';
}

}  // namespace

TextEncoding textEncodingNamed(std::string_view languageEncoding) {
    const auto* entry = std::ranges::find(kEncodings, languageEncoding, &Encoding::languageEncoding);
    return entry == kEncodings.end() ? TextEncoding::UTF8 : entry->encoding;
}

std::optional<std::string> decoded(std::string_view bytes, TextEncoding encoding) {
    const auto* entry = std::ranges::find(kEncodings, encoding, &Encoding::encoding);
    if (entry == kEncodings.end())
        return isValidUtf8(bytes) ? std::optional<std::string>(bytes) : std::nullopt;
    // A converter is a library of its own, which takes longer to load than a whole PPD takes to read.
    if (std::ranges::all_of(bytes, isPlainAscii))
        return std::string(bytes);

    gsize written = 0;
    const std::unique_ptr<gchar, decltype(&g_free)> text{
        g_convert(bytes.data(), static_cast<gssize>(bytes.size()), "UTF-8", entry->converter, nullptr,
                  &written, nullptr),
        g_free};
    if (!text)
        return std::nullopt;
    return std::string(text.get(), written);
}

}  // namespace ventras
