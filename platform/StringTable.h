#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// Texts for people, in the user's language. Any thread may ask.
class StringTable {
public:
    virtual ~StringTable() = default;

    /// The translation of an English text; the text itself when there is none.
    virtual std::string localizedString(std::string_view english) const = 0;
};

}  // namespace ventras
