#include "platform/PrintToolAgentChannel.h"

#include <charconv>

namespace ventras {

std::int64_t packageCount(const PrintToolAgentReply& reply) {
    const auto count = reply.dictionary.find(PrintToolAgentKeys::kCount);
    if (reply.status != 0 || count == reply.dictionary.end())
        return 0;
    if (const auto* number = std::get_if<std::int64_t>(&count->second))
        return *number;
    if (const auto* flag = std::get_if<bool>(&count->second))
        return *flag ? 1 : 0;
    std::int64_t number = 0;
    if (const auto* text = std::get_if<std::string>(&count->second))
        std::from_chars(text->data(), text->data() + text->size(), number);
    return number;
}

}  // namespace ventras
