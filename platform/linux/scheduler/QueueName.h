#pragma once

#include <cstddef>
#include <set>
#include <string>
#include <string_view>

namespace ventras {

/// The scheduler's limit for a destination's name, and for texts about it (name(127), text(127) in RFC 8011),
/// in bytes.
inline constexpr std::size_t kLongestQueueText = 127;

/// Names compared as the scheduler does: upper and lower case of ASCII letters are the same.
struct QueueNameLess {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const;
};
using QueueNames = std::set<std::string, QueueNameLess>;

/// A text with the characters replaced that the scheduler refuses in a destination's name, cut to its limit.
/// Empty only for an empty text.
std::string queueNameFrom(std::string_view text);

/// `name`, or `name` with the first of "_2", "_3", ... that makes it differ from all `taken` ones.
std::string uniqueQueueName(const std::string& name, const QueueNames& taken);

/// Whether the scheduler takes this name for a destination.
bool isQueueName(std::string_view name);

}  // namespace ventras
