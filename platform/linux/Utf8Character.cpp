#include "platform/linux/Utf8Character.h"

#include "platform/Utf8.h"

namespace ventras {

std::string_view firstUtf8Character(std::string_view text) {
    constexpr std::size_t kLongest = 4;
    for (std::size_t length = 1; length <= kLongest && length <= text.size(); ++length)
        if (isValidUtf8(text.substr(0, length)))
            return text.substr(0, length);
    return {};
}

}  // namespace ventras
