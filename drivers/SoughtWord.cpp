#include "drivers/SoughtWord.h"

#include <algorithm>

#include "deviceid/TextScan.h"

namespace ventras {
namespace {

constexpr bool isLetter(char c) {
    return c >= 'a' && c <= 'z';
}

// Texts of devices are mostly letters: what is none is seldom there, and needs no folding.
std::size_t rarestIn(std::string_view word) {
    const auto found = std::ranges::find_if_not(word, isLetter);
    return found == word.end() ? 0 : static_cast<std::size_t>(found - word.begin());
}

std::size_t findCharacter(std::string_view text, char wanted, std::size_t from) {
    if (!isLetter(wanted))
        return text.find(wanted, from);
    const auto* const found =
        std::find_if(text.data() + std::min(from, text.size()), text.data() + text.size(),
                     [wanted](char c) { return static_cast<char>(c | 0x20) == wanted; });
    return found == text.data() + text.size() ? std::string_view::npos
                                              : static_cast<std::size_t>(found - text.data());
}

}  // namespace

SoughtWord::SoughtWord(std::string_view word) : word_(TextScan::lowerCased(word)), anchor_(rarestIn(word_)) {}

bool SoughtWord::isRare() const {
    constexpr std::size_t kShortest = 3;  // one digit is in every other text
    return word_.size() >= kShortest && word_.find_first_of("0123456789") != std::string::npos;
}

std::size_t SoughtWord::findIn(std::string_view text) const {
    for (auto at = findCharacter(text, word_[anchor_], anchor_); at != std::string_view::npos;
         at = findCharacter(text, word_[anchor_], at + 1)) {
        if (TextScan::startsWithIgnoringCase(text.substr(at - anchor_), word_))
            return at - anchor_;
    }
    return std::string_view::npos;
}

}  // namespace ventras
