#include "platform/linux/scheduler/QueueName.h"

#include <algorithm>

#include "platform/Utf8.h"
#include "platform/linux/Utf8Character.h"

namespace ventras {
namespace {

constexpr char kReplacement = '_';

bool isRefused(std::string_view character) {
    return character == " " || character == "/" || character == "#" || hasControlCharacters(character);
}

char folded(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

}  // namespace

bool QueueNameLess::operator()(std::string_view a, std::string_view b) const {
    return std::ranges::lexicographical_compare(a, b, {}, folded, folded);
}

std::string queueNameFrom(std::string_view text) {
    std::string name;
    while (!text.empty()) {
        const auto character = firstUtf8Character(text);
        name += character.empty() || isRefused(character) ? std::string_view(&kReplacement, 1) : character;
        text.remove_prefix(std::max<std::size_t>(character.size(), 1));
    }
    return std::string(truncateUtf8(name, kLongestQueueText));
}

std::string uniqueQueueName(const std::string& name, const QueueNames& taken) {
    std::string candidate = name;
    for (int number = 2; taken.contains(candidate); ++number) {
        const auto suffix = "_" + std::to_string(number);
        candidate = std::string(truncateUtf8(name, kLongestQueueText - suffix.size())) + suffix;
    }
    return candidate;
}

bool isQueueName(std::string_view name) {
    return !name.empty() && queueNameFrom(name) == name;
}

}  // namespace ventras
