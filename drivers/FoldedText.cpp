#include "drivers/FoldedText.h"

#include <glib.h>

#include <algorithm>
#include <array>
#include <cstring>

namespace ventras {
namespace {

constexpr bool isAscii(char c) {
    return static_cast<unsigned char>(c) < 0x80;
}

constexpr char foldedAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

/// One character at the beginning of a text, folded.
struct FoldedCharacter {
    std::array<char, 6> bytes{};
    std::size_t length = 1;

    std::string_view view() const { return {bytes.data(), length}; }
};

FoldedCharacter firstFolded(std::string_view text) {
    FoldedCharacter result;
    result.bytes[0] = foldedAscii(text.front());
    if (isAscii(text.front()))
        return result;

    constexpr gunichar kMalformed = static_cast<gunichar>(-2);  // this and the next above it
    const auto character = g_utf8_get_char_validated(text.data(), static_cast<gssize>(text.size()));
    if (character >= kMalformed)
        return result;

    result.length = static_cast<std::size_t>(g_unichar_to_utf8(character, result.bytes.data()));
    FoldedCharacter lower;
    lower.length =
        static_cast<std::size_t>(g_unichar_to_utf8(g_unichar_tolower(character), lower.bytes.data()));
    return lower.length == result.length ? lower : result;
}

/// Whether `text`, with each byte passed through `mapped`, folds to `foldedText` of the same length.
template <typename Mapping>
bool foldsTo(std::string_view text, std::string_view foldedText, Mapping mapped) {
    for (std::size_t i = 0; i < text.size();) {
        if (isAscii(text[i])) {
            if (foldedAscii(mapped(text[i])) != foldedText[i])
                return false;
            ++i;
            continue;
        }
        const auto character = firstFolded(text.substr(i));
        if (!foldedText.substr(i).starts_with(character.view()))
            return false;
        i += character.length;
    }
    return true;
}

constexpr char asItStands(char c) {
    return c;
}

constexpr char spaceForSlash(char c) {
    return c == '/' ? ' ' : c;
}

}  // namespace

std::string folded(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        const auto character = firstFolded(text);
        result += character.view();
        text.remove_prefix(character.length);
    }
    return result;
}

void FoldedTexts::add(std::string_view text) {
    auto foldedText = folded(text);
    if (foldedText.empty() || std::ranges::find(texts_, foldedText) != texts_.end())
        return;
    lengths_ |= std::uint64_t{1} << std::min<std::size_t>(foldedText.size(), 63);
    texts_.push_back(std::move(foldedText));
}

bool FoldedTexts::contain(std::string_view text) const {
    return haveLength(text.size()) && std::ranges::any_of(texts_, [&](const auto& own) {
               return own.size() == text.size() && foldsTo(text, own, asItStands);
           });
}

bool FoldedTexts::containWithSpacesForSlashes(std::string_view text) const {
    return haveLength(text.size()) && std::ranges::any_of(texts_, [&](const auto& own) {
               return own.size() == text.size() && foldsTo(text, own, spaceForSlash);
           });
}

bool FoldedTexts::begin(std::string_view text) const {
    return std::ranges::any_of(texts_, [&](const auto& own) {
        return own.size() <= text.size() && foldsTo(text.substr(0, own.size()), own, asItStands);
    });
}

bool FoldedTexts::haveLength(std::size_t length) const {
    return (lengths_ >> std::min<std::size_t>(length, 63) & 1) != 0;
}

}  // namespace ventras
