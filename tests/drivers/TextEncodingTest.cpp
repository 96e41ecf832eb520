#include "drivers/TextEncoding.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

struct DecodingCase {
    TextEncoding encoding;
    std::string_view bytes;
    std::optional<std::string> text;
};

TEST(TextEncoding, IsReadAsUtf8) {
    const DecodingCase kCases[] = {
        {TextEncoding::UTF8, "Caf\xC3\xA9", "Caf\xC3\xA9"},
        {TextEncoding::UTF8, "Caf\xE9", std::nullopt},
        {TextEncoding::ISOLatin1, "Caf\xE9 \x80", "Caf\xC3\xA9 \xC2\x80"},
        {TextEncoding::WindowsCP1252, "Caf\xE9 \x80", "Caf\xC3\xA9 \xE2\x82\xAC"},
        {TextEncoding::WindowsCP1252, "\x81", std::nullopt},
        {TextEncoding::ShiftJIS, "\x83\x65", "\xE3\x83\x86"},
        {TextEncoding::ShiftJIS, "\x83", std::nullopt},
        {TextEncoding::ShiftJIS, "a\\b~c", "a\\b~c"},
    };
    for (const auto& [encoding, bytes, text] : kCases)
        EXPECT_EQ(decoded(bytes, encoding), text) << "encoding " << static_cast<int>(encoding);
}

TEST(TextEncoding, IsTheSameForAsciiInAll) {
    std::string ascii;
    for (char c = 1; c < 0x7F; ++c)
        ascii += c;
    for (const auto encoding :
         {TextEncoding::UTF8, TextEncoding::ISOLatin1, TextEncoding::WindowsCP1252, TextEncoding::ShiftJIS})
        EXPECT_EQ(decoded(ascii, encoding), ascii) << "encoding " << static_cast<int>(encoding);
    for (const auto encoding : {TextEncoding::ISOLatin1, TextEncoding::ShiftJIS})
        EXPECT_EQ(decoded("", encoding), "");
}

}  // namespace
}  // namespace ventras
