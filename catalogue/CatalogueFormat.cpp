#include "catalogue/CatalogueFormat.h"

#include <algorithm>

#include "platform/Utf8.h"

namespace ventras::CatalogueFormat {
namespace {

bool isSmallLetterOrDigit(char c) {
    return (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
}

bool isOfName(char c) {
    return isSmallLetterOrDigit(c) || c == '+' || c == '-' || c == '.';
}

}  // namespace

bool isPackageName(std::string_view text) {
    return text.size() >= 2 && text.size() <= 128 && isSmallLetterOrDigit(text.front()) &&
           std::ranges::all_of(text, isOfName);
}

bool isPlainText(std::string_view text) {
    return !text.empty() && text.size() <= kLongestText && isValidUtf8(text) && !hasControlCharacters(text);
}

}  // namespace ventras::CatalogueFormat
