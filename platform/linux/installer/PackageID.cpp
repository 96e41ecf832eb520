#include "platform/linux/installer/PackageID.h"

#include <algorithm>

#include "platform/Utf8.h"

namespace ventras {
namespace {

constexpr std::size_t kLongest = 1024;
constexpr auto kSeparators = 3;

}  // namespace

std::optional<PackageID> PackageID::parse(std::string_view text) {
    if (text.size() > kLongest || !isValidUtf8(text) || hasControlCharacters(text) ||
        std::ranges::count(text, ';') != kSeparators)
        return std::nullopt;
    PackageID id{std::string(text), {}, {}, {}};
    for (auto* field : {&id.name, &id.version, &id.architecture}) {
        const auto end = text.find(';');
        *field = text.substr(0, end);
        text.remove_prefix(end + 1);
    }
    return id.name.empty() ? std::nullopt : std::optional{std::move(id)};
}

}  // namespace ventras
