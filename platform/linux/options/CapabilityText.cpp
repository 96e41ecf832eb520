#include "platform/linux/options/CapabilityText.h"

#include <algorithm>

#include "platform/Utf8.h"
#include "platform/linux/Utf8Character.h"

namespace ventras {
namespace {

constexpr std::size_t kLongestName = 255;
constexpr std::size_t kLongestModel = 80;

// Everything of ASCII that has a meaning in PPD syntax or PostScript is missing here: " / : * % ( ) < > [ ] {
// } \ ^ |
bool isHarmlessAscii(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
           std::string_view(" -_.+,&=@!").find(c) != std::string_view::npos;
}

bool isHarmless(std::string_view character) {
    return character.size() == 1 ? isHarmlessAscii(character.front())
                                 : !character.empty() && !hasControlCharacters(character);
}

}  // namespace

bool isHarmlessName(std::string_view name) {
    if (name.empty() || name.size() > kLongestName)
        return false;
    while (!name.empty()) {
        const auto character = firstUtf8Character(name);
        if (!isHarmless(character))
            return false;
        name.remove_prefix(character.size());
    }
    return true;
}

std::string harmlessModel(std::string_view text) {
    std::string model;
    while (!text.empty()) {
        const auto character = firstUtf8Character(text);
        const bool isKept = isHarmless(character) && character != " ";
        if (isKept)
            model += character;
        else if (!model.empty() && model.back() != ' ')
            model += ' ';
        text.remove_prefix(std::max<std::size_t>(character.size(), 1));
    }
    model = truncateUtf8(model, kLongestModel);
    model.erase(model.find_last_not_of(' ') + 1);
    return model;
}

}  // namespace ventras
