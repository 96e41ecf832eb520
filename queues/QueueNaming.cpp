#include "queues/QueueNaming.h"

#include "deviceid/TextScan.h"
#include "platform/PrintSystemService.h"
#include "platform/Utf8.h"

namespace ventras {
namespace {

constexpr std::size_t kShortestTag = 5;
constexpr std::size_t kLongestTag = 7;

}  // namespace

std::string suggestedDisplayName(PrintSystemService& printSystem, const std::string& name) {
    const auto plain = printSystem.suggestQueueName(name, false);
    const auto unique = printSystem.suggestQueueName(name, true);
    if (!plain || !unique || unique->size() <= plain->size() || !unique->starts_with(*plain))
        return name;
    return name + " " + unique->substr(plain->size() + 1);
}

std::string stripBracketedTag(std::string_view name) {
    const auto open = name.rfind('[');
    if (open == std::string_view::npos || !name.ends_with(']'))
        return std::string(name);
    const auto length = characterCount(name.substr(open + 1, name.size() - open - 2));
    if (length < kShortestTag || length > kLongestTag)
        return std::string(name);
    return std::string(TextScan::trimmedOfLineEnds(name.substr(0, open)));
}

}  // namespace ventras
