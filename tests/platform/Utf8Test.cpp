#include "platform/Utf8.h"

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace ventras {
namespace {

using namespace std::string_view_literals;

struct TextCase {
    std::string_view text;
    bool valid;
    const char* what;
};

constexpr TextCase kTexts[] = {
    {"", true, "nothing"},
    {"plain", true, "ASCII"},
    {"\x7f\x1b\n\t", true, "control characters are characters"},
    {"é ü €", true, "two and three bytes"},
    {"😀", true, "four bytes"},
    {"\xf4\x8f\xbf\xbf", true, "the last code point"},
    {"\xf4\x90\x80\x80", false, "beyond the last code point"},
    {"\xed\xa0\x80", false, "a surrogate"},
    {"\xc0\xaf", false, "an overlong slash"},
    {"\xe0\x80\xaf", false, "a longer overlong slash"},
    {"\xf0\x80\x80\xaf", false, "the longest overlong slash"},
    {"\x80", false, "a lonely continuation"},
    {"\xc3", false, "a cut character of two bytes"},
    {"\xe2\x82", false, "a cut character of three bytes"},
    {"a\xffz", false, "a byte that is never used"},
    {"caf\xe9", false, "Latin-1"},
    {"a\0b"sv, false, "NUL"},
};

TEST(Utf8, KnowsWellFormedText) {
    for (const auto& [text, valid, what] : kTexts)
        EXPECT_EQ(isValidUtf8(text), valid) << what;
}

struct ControlCase {
    std::string_view text;
    bool has;
};

constexpr ControlCase kControls[] = {
    {"", false},        {"plain text", false}, {"é€😀", false}, {"tab\t", true}, {"line\n", true},
    {"\x1b[31m", true}, {"\x1f", true},        {"\x7f", true}, {" ", false},    {"\xc2\x80", true},
    {"\xc2\x9f", true}, {"\xc2\xa0", false},   {"À", false},   {"Ã", false},    {"\0"sv, true},
};

TEST(Utf8, FindsControlCharacters) {
    for (const auto& [text, has] : kControls)
        EXPECT_EQ(hasControlCharacters(text), has) << testing::PrintToString(std::string(text));
}

TEST(Utf8, CountsCharactersNotBytes) {
    EXPECT_EQ(characterCount(""), 0U);
    EXPECT_EQ(characterCount("abc"), 3U);
    EXPECT_EQ(characterCount("é€😀"), 3U);
}

struct CutCase {
    std::string_view text;
    std::size_t bytes;
    std::string_view expected;
};

constexpr CutCase kCuts[] = {
    {"abc", 5, "abc"}, {"abc", 3, "abc"}, {"abc", 2, "ab"}, {"abc", 0, ""}, {"", 0, ""},    {"aé", 3, "aé"},
    {"aé", 2, "a"},    {"€", 2, ""},      {"€", 3, "€"},    {"😀b", 3, ""},  {"😀b", 4, "😀"}, {"a😀", 4, "a"},
};

TEST(Utf8, CutsBetweenCharacters) {
    for (const auto& [text, bytes, expected] : kCuts)
        EXPECT_EQ(truncateUtf8(text, bytes), expected) << text << " at " << bytes;
}

TEST(Utf8, CutsAnyTextToAnyLengthWithoutHarm) {
    constexpr std::string_view kAlphabet[] = {"a", "é", "€", "😀"};
    std::mt19937 random(7);
    for (int round = 0; round < 500; ++round) {
        std::string text;
        for (unsigned i = 0; i < random() % 20; ++i)
            text += kAlphabet[random() % 4];
        for (std::size_t bytes = 0; bytes <= text.size() + 2; ++bytes) {
            const auto cut = truncateUtf8(text, bytes);
            EXPECT_LE(cut.size(), bytes) << text;
            EXPECT_TRUE(text.starts_with(cut)) << text;
            EXPECT_TRUE(isValidUtf8(cut)) << text << " at " << bytes;
            EXPECT_LT(std::min(bytes, text.size()) - cut.size(), 4U) << text << " at " << bytes;
        }
    }
}

}  // namespace
}  // namespace ventras
