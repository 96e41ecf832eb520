#include "backend/usb/StockDeviceURI.h"

#include <cups/http.h>
#include <strings.h>

#include <algorithm>
#include <array>
#include <charconv>

namespace ventras {
namespace {

using namespace std::string_view_literals;

constexpr auto kScheme = "usb://"sv;
constexpr auto kLocationQuery = "?location="sv;
constexpr auto kBlanks = " \t"sv;

struct ShortMake {
    std::string_view make, inShort;
};
// A make counts as a whole and in any case.
constexpr ShortMake kShortMakes[] = {
    {"Hewlett-Packard", "HP"},
    {"Lexmark International", "Lexmark"},
};

bool equalIgnoringCase(std::string_view one, std::string_view other) {
    return one.size() == other.size() && strncasecmp(one.data(), other.data(), one.size()) == 0;
}

std::string_view shortMake(std::string_view make) {
    const auto found = std::ranges::find_if(
        kShortMakes, [make](const ShortMake& known) { return equalIgnoringCase(known.make, make); });
    return found == std::end(kShortMakes) ? make : found->inShort;
}

/// Drops the make once, if more follows behind a blank.
std::string_view withoutMake(std::string_view model, std::string_view make) {
    if (make.empty() || !equalIgnoringCase(model.substr(0, make.size()), make))
        return model;
    const auto rest = model.substr(make.size());
    const auto begin = rest.find_first_not_of(kBlanks);
    return begin == std::string_view::npos || begin == 0 ? model : rest.substr(begin);
}

/// libcups's spelling, which is the stock backend's too; empty when it gets too long.
std::string assembled(const std::string& make, const std::string& model) {
    std::array<char, HTTP_MAX_URI> uri{};
    const auto status = httpAssembleURI(HTTP_URI_CODING_ALL, uri.data(), static_cast<int>(uri.size()), "usb",
                                        nullptr, make.c_str(), 0, ("/" + model).c_str());
    return status == HTTP_URI_STATUS_OK ? uri.data() : "";
}

}  // namespace

std::string percentDecoded(std::string_view text) {
    std::string bytes;
    while (!text.empty()) {
        unsigned char byte = 0;
        const auto* digits = text.data() + 1;
        const bool isCode = text.size() > 2 && text.front() == '%' &&
                            std::from_chars(digits, digits + 2, byte, 16).ptr == digits + 2;
        bytes += isCode ? static_cast<char>(byte) : text.front();
        text.remove_prefix(isCode ? 3 : 1);
    }
    return bytes;
}

std::string stockDeviceURI(std::string_view uri) {
    const auto slash = uri.find('/', kScheme.size());
    if (!uri.starts_with(kScheme) || slash == std::string_view::npos)
        return std::string(uri);
    auto query = std::min(uri.find('?', slash), uri.size());
    const auto make = percentDecoded(uri.substr(kScheme.size(), slash - kScheme.size()));
    const auto model = percentDecoded(uri.substr(slash + 1, query - slash - 1));
    if (uri.substr(query).starts_with(kLocationQuery)) {
        uri = uri.substr(0, query);
        query = uri.size();
    }
    const auto inShort = shortMake(make);
    const auto bare = withoutMake(model, inShort);
    if (inShort == make && bare == model)
        return std::string(uri);
    const auto changed = assembled(std::string(inShort), std::string(bare));
    return changed.empty() ? std::string(uri) : changed + std::string(uri.substr(query));
}

}  // namespace ventras
