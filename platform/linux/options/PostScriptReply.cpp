#include "platform/linux/options/PostScriptReply.h"

#include <algorithm>
#include <array>

#include "platform/Utf8.h"

namespace ventras::PostScriptReply {
namespace {

// Line ends of any system, and the end of a job.
constexpr std::string_view kBreaks("\r\n\x04", 3);
constexpr std::string_view kBlanks = " \t";

std::string_view trimmed(std::string_view text) {
    const auto begin = text.find_first_not_of(kBlanks);
    return begin == text.npos ? std::string_view{}
                              : text.substr(begin, text.find_last_not_of(kBlanks) - begin + 1);
}

struct Escape {
    char letter, meaning;
};

constexpr std::array kEscapes{Escape{'n', '\n'}, Escape{'r', '\r'}, Escape{'t', '\t'}, Escape{'b', '\b'},
                              Escape{'f', '\f'}};

bool isOctal(char c) {
    return c >= '0' && c <= '7';
}

/// The character behind a backslash; `at` stands on it and moves to its last digit.
char escaped(std::string_view text, std::size_t& at) {
    if (const auto escape = std::ranges::find(kEscapes, text[at], &Escape::letter); escape != kEscapes.end())
        return escape->meaning;
    if (!isOctal(text[at]))
        return text[at];
    unsigned code = 0;
    std::size_t digits = 0;
    while (digits < 3 && at + digits < text.size() && isOctal(text[at + digits]))
        code = code * 8 + static_cast<unsigned>(text[at + digits++] - '0');
    at += digits - 1;
    return static_cast<char>(code);
}

}  // namespace

std::vector<std::string> printedLines(std::string_view reply) {
    std::vector<std::string> lines;
    while (!reply.empty()) {
        const auto end = reply.find_first_of(kBreaks);
        const auto line = trimmed(reply.substr(0, end));
        if (!line.empty() && !line.starts_with("%%["))
            lines.emplace_back(line);
        reply.remove_prefix(end == reply.npos ? reply.size() : end + 1);
    }
    return lines;
}

std::optional<std::string> stringValue(std::string_view line) {
    if (line.size() < 2 || line.front() != '(' || line.back() != ')')
        return std::nullopt;
    const auto inside = line.substr(1, line.size() - 2);
    std::string text;
    for (std::size_t at = 0; at < inside.size(); ++at) {
        if (inside[at] != '\\')
            text += inside[at];
        else if (++at < inside.size())
            text += escaped(inside, at);
        else
            return std::nullopt;  // the last parenthesis was no end
    }
    if (!isValidUtf8(text) || hasControlCharacters(text))
        return std::nullopt;
    return text;
}

}  // namespace ventras::PostScriptReply
