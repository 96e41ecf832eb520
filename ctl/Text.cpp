#include "ctl/Text.h"

#include <glib.h>

#include <algorithm>
#include <memory>
#include <vector>

#include "ctl/Translation.h"
#include "platform/Utf8.h"

namespace ventras {
namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";
constexpr std::string_view kGap = "  ";

std::string withoutControls(const std::string& text) {
    const std::unique_ptr<char, decltype(&g_free)> valid{
        g_utf8_make_valid(text.c_str(), static_cast<gssize>(text.size())), &g_free};
    std::string safe;
    for (const char* at = valid.get(); *at != '\0'; at = g_utf8_next_char(at)) {
        const std::string_view character(at, static_cast<std::size_t>(g_utf8_next_char(at) - at));
        safe += hasControlCharacters(character) ? kReplacement : character;
    }
    return safe;
}

struct Writer {
    std::string operator()(std::monostate) const { return "-"; }
    std::string operator()(bool flag) const {
        return translated(flag ? translatable("yes") : translatable("no"));
    }
    std::string operator()(std::int64_t number) const { return std::to_string(number); }
    std::string operator()(double number) const { return std::to_string(number); }
    std::string operator()(const std::string& text) const { return withoutControls(text); }
    std::string operator()(const Array& array) const {
        std::string text;
        for (const auto& value : array)
            text.append(text.empty() ? "" : ", ").append(textOf(value));
        return text.empty() ? "-" : text;
    }
    std::string operator()(const Object& object) const {
        std::string text;
        for (const auto& [key, value] : object)
            text.append(text.empty() ? "" : "; ")
                .append(withoutControls(key))
                .append(": ")
                .append(textOf(value));
        return text.empty() ? "-" : text;
    }
};

void appendPadded(std::string& line, const std::string& text, std::size_t width) {
    line += text;
    const auto characters = characterCount(text);
    line.append(width > characters ? width - characters : 0, ' ');
}

using Cells = std::vector<std::string>;

std::string aligned(const std::vector<Cells>& lines) {
    std::vector<std::size_t> widths;
    for (const auto& cells : lines) {
        widths.resize(std::max(widths.size(), cells.size()));
        for (std::size_t i = 0; i + 1 < cells.size(); ++i)
            widths[i] = std::max(widths[i], characterCount(cells[i]));
    }
    std::string text;
    for (const auto& cells : lines) {
        for (std::size_t i = 0; i < cells.size(); ++i) {
            text += i == 0 ? "" : kGap;
            appendPadded(text, cells[i], widths[i]);
        }
        text += '\n';
    }
    return text;
}

Cells rowOf(const Value& row, std::span<const Column> columns) {
    Cells cells;
    const auto* object = std::get_if<Object>(&row);
    for (const auto& column : columns) {
        const auto* value = object == nullptr ? nullptr : find(*object, column.key);
        cells.push_back(value == nullptr ? "-" : textOf(*value));
    }
    return cells;
}

}  // namespace

std::string textTable(const Array& rows, std::span<const Column> columns) {
    if (rows.empty())
        return "";
    std::vector<Cells> lines(1);
    for (const auto& column : columns)
        lines.front().push_back(translated(column.heading));
    for (const auto& row : rows)
        lines.push_back(rowOf(row, columns));
    return aligned(lines);
}

std::string textLines(const Object& object) {
    std::vector<Cells> lines;
    for (const auto& [key, value] : object)
        lines.push_back({withoutControls(key), textOf(value)});
    return aligned(lines);
}

std::string textOf(const Value& value) {
    return std::visit(Writer{}, value);
}

}  // namespace ventras
