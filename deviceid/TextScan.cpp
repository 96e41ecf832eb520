#include "deviceid/TextScan.h"

#include <algorithm>

namespace ventras::TextScan {
namespace {

constexpr std::string_view kWhiteSpace = " \t";
constexpr std::string_view kWhiteSpaceAndLineEnds = " \t\n\v\f\r";

constexpr char folded(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

constexpr bool sameLetter(char left, char right) {
    return folded(left) == folded(right);
}

std::string_view trimmedOf(std::string_view text, std::string_view set) {
    const auto first = text.find_first_not_of(set);
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(set) - first + 1);
}

}  // namespace

bool equalsIgnoringCase(std::string_view left, std::string_view right) {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(), sameLetter);
}

bool startsWithIgnoringCase(std::string_view text, std::string_view prefix) {
    return !prefix.empty() && equalsIgnoringCase(text.substr(0, prefix.size()), prefix);
}

std::size_t findIgnoringCase(std::string_view text, std::string_view wanted) {
    if (wanted.empty())
        return std::string_view::npos;
    const auto found = std::search(text.begin(), text.end(), wanted.begin(), wanted.end(), sameLetter);
    return found == text.end() ? std::string_view::npos : static_cast<std::size_t>(found - text.begin());
}

bool startsWith(std::string_view text, std::string_view prefix) {
    return !prefix.empty() && text.starts_with(prefix);
}

std::string lowerCased(std::string_view text) {
    std::string lower(text);
    std::ranges::transform(lower, lower.begin(), folded);
    return lower;
}

std::string_view trimmed(std::string_view text) {
    return trimmedOf(text, kWhiteSpace);
}

std::string_view trimmedOfLineEnds(std::string_view text) {
    return trimmedOf(text, kWhiteSpaceAndLineEnds);
}

std::optional<std::string_view> Components::next() {
    if (!rest_)
        return std::nullopt;
    const auto end = separator_.empty() ? std::string_view::npos : rest_->find(separator_);
    const auto component = rest_->substr(0, end);
    if (end == std::string_view::npos)
        rest_.reset();
    else
        rest_->remove_prefix(end + separator_.size());
    return component;
}

}  // namespace ventras::TextScan
