#include "platform/linux/installer/InstallQuestion.h"

#include <algorithm>

#include "platform/Utf8.h"
#include "platform/linux/Syslog.h"

namespace ventras {
namespace {

constexpr std::size_t kLongestLine = 200;  // bytes
constexpr std::size_t kMostLines = 8;      // of packages, and of devices
constexpr std::size_t kMostTextLines = 60;
constexpr std::string_view kCut = "…";

void addLine(std::string& text, std::string_view line) {
    if (!text.empty())
        text += '\n';
    text += line;
}

template <class Items, class LineOf>
void addLines(std::string& text, const Items& items, LineOf lineOf) {
    const auto shown = std::min(items.size(), kMostLines);
    for (std::size_t i = 0; i < shown; ++i)
        addLine(text, lineOf(items[i]));
    if (shown < items.size())
        addLine(text, kCut);
}

}  // namespace

std::string plainText(std::string_view text) {
    // Whoever sends megabytes does not get them escaped first.
    auto line = harmlessLine(text.substr(0, 2 * kLongestLine));
    if (line.size() <= kLongestLine && text.size() <= 2 * kLongestLine)
        return line;
    return std::string(truncateUtf8(line, kLongestLine)).append(kCut);
}

std::string plainLines(std::string_view text) {
    std::string lines;
    for (std::size_t count = 0; !text.empty(); ++count) {
        if (count == kMostTextLines) {
            addLine(lines, kCut);
            break;
        }
        const auto end = std::min(text.find('\n'), text.size());
        addLine(lines, plainText(text.substr(0, end)));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

std::string offerText(const std::vector<OfferedPackage>& packages, const std::vector<std::string>& devices) {
    std::string text;
    addLines(text, packages, [](const OfferedPackage& package) {
        return plainText(package.title) + " (" + plainText(package.name) + " " + plainText(package.version) +
               ")";
    });
    addLines(text, devices, [](const std::string& device) { return plainText(device); });
    return text;
}

std::string escapeMarkup(std::string_view text) {
    std::string escaped;
    for (const char character : text)
        switch (character) {
            case '&':
                escaped += "&amp;";
                break;
            case '<':
                escaped += "&lt;";
                break;
            case '>':
                escaped += "&gt;";
                break;
            default:
                escaped += character;
        }
    return escaped;
}

}  // namespace ventras
