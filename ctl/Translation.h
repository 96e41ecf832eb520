#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// Marks a text that is translated where it is shown, for xgettext.
constexpr const char* translatable(const char* english) {
    return english;
}

/// One of the program's own texts in the language of the user's environment; itself where there is no
/// translation. JSON is the same in all languages. Any thread may call.
std::string translated(std::string_view english);

/// The same with a value in the place of its "%@".
std::string translated(std::string_view english, std::string_view value);

}  // namespace ventras
