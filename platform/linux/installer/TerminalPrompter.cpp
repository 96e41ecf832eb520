#include "platform/linux/installer/TerminalPrompter.h"

#include <termios.h>

#include <algorithm>
#include <array>
#include <string_view>

#include "deviceid/TextScan.h"

namespace ventras {
namespace {

constexpr std::array<std::string_view, 2> kYes{"y", "yes"};
constexpr std::string_view kClearLine = "\r\033[K";
constexpr std::size_t kLongestLine = 1024;

bool saysYes(std::string_view line) {
    const auto word = TextScan::lowerCased(TextScan::trimmedOfLineEnds(line));
    return std::ranges::find(kYes, word) != kYes.end();
}

}  // namespace

// A process in the background that reads from its terminal is stopped.
bool TerminalPrompter::isTerminalOurs() const {
    if (isatty(input_) == 0 || isatty(output_) == 0)
        return false;
    const auto foreground = tcgetpgrp(input_);
    return foreground < 0 || foreground == getpgrp();
}

PromptAnswer TerminalPrompter::ask(const InstallQuestion& question, Deadline deadline) {
    if (!isTerminalOurs())
        return PromptAnswer::NotAsked;
    // What was typed before the question is no answer to it.
    tcflush(input_, TCIFLUSH);
    write(question.title + "\n" + question.body + "\n" + question.yes + "? [y/N] ");

    std::array<char, kLongestLine> line{};
    if (!events_.waitUntilReadable(input_, deadline) || !isTerminalOurs()) {
        write("\n");
        return PromptAnswer::Unanswered;
    }
    const auto length = read(input_, line.data(), line.size());
    if (length <= 0)
        return PromptAnswer::Unanswered;
    return saysYes({line.data(), static_cast<std::size_t>(length)}) ? PromptAnswer::Yes : PromptAnswer::No;
}

void TerminalPrompter::showProgress(const std::string& text, std::optional<std::uint32_t> percent) {
    isProgressShown_ = true;
    write(std::string(kClearLine) + text + (percent ? " " + std::to_string(*percent) + " %" : ""));
}

void TerminalPrompter::finish(const std::string& title, const std::string& message) {
    if (isProgressShown_)
        write("\n");
    isProgressShown_ = false;
    if (!title.empty())
        write(message.empty() ? title + "\n" : title + "\n" + message + "\n");
}

void TerminalPrompter::write(const std::string& text) const {
    // A terminal that is gone has nobody at it.
    [[maybe_unused]] const auto written = ::write(output_, text.data(), text.size());
}

}  // namespace ventras
