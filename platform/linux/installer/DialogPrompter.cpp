#include "platform/linux/installer/DialogPrompter.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "platform/linux/installer/Display.h"

namespace ventras {
namespace {

constexpr int kExitYes = 0;
constexpr int kExitNo = 1;
constexpr int kExitTimeout = 5;  // zenity's, told to give up
constexpr auto kNoticeTime = "60";

using Words = std::vector<std::string>;

std::string wholeText(const InstallQuestion& question) {
    return question.body.empty() ? question.title : question.title + "\n\n" + question.body;
}

// kdialog guesses whether a text is markup; said so, it need not.
std::string asMarkup(const std::string& text) {
    std::string markup = "<qt>";
    for (const char character : escapeMarkup(text))
        if (character == '\n')
            markup += "<br>";
        else
            markup += character;
    return markup + "</qt>";
}

Words zenityQuestion(const InstallQuestion& question, std::chrono::seconds limit) {
    return {"zenity",
            "--question",
            "--no-markup",
            "--default-cancel",
            "--timeout=" + std::to_string(limit.count()),
            "--title=" + question.title,
            "--text=" + wholeText(question),
            "--ok-label=" + question.yes,
            "--cancel-label=" + question.no};
}

Words zenityProgress(const std::string& title) {
    return {"zenity", "--progress", "--no-cancel", "--auto-close", "--title=" + title, "--text="};
}

Words zenityNotice(const std::string& title, const std::string& message) {
    return {"zenity",           "--info",
            "--no-markup",      std::string("--timeout=") + kNoticeTime,
            "--title=" + title, "--text=" + (message.empty() ? title : message)};
}

Words kdialogQuestion(const InstallQuestion& question, std::chrono::seconds) {
    return {"kdialog",
            "--icon=printer",
            "--title=" + question.title,
            "--yes-label=" + question.yes,
            "--no-label=" + question.no,
            "--yesno",
            asMarkup(wholeText(question))};
}

Words kdialogNotice(const std::string& title, const std::string& message) {
    return {"kdialog", "--title=" + title, "--passivepopup", asMarkup(message.empty() ? title : message),
            kNoticeTime};
}

bool isInstalled(const char* program) {
    return GTextPtr{g_find_program_in_path(program)} != nullptr;
}

}  // namespace

struct DialogPrompter::Kind {
    const char* program;
    Words (*question)(const InstallQuestion& question, std::chrono::seconds limit);
    Words (*progress)(const std::string& title);  // null: it shows none
    Words (*notice)(const std::string& title, const std::string& message);
};

namespace {

constexpr std::array kKinds{DialogPrompter::Kind{"zenity", zenityQuestion, zenityProgress, zenityNotice},
                            DialogPrompter::Kind{"kdialog", kdialogQuestion, nullptr, kdialogNotice}};

}  // namespace

PromptAnswer DialogPrompter::ask(const InstallQuestion& question, Deadline deadline) {
    if (!isDisplayThere())
        return PromptAnswer::NotAsked;
    title_ = question.title;
    for (const auto& kind : kKinds) {
        if (!isInstalled(kind.program))
            continue;
        kind_ = &kind;
        // The window takes itself away should this program be killed meanwhile.
        start(kind.question(question, std::chrono::ceil<std::chrono::seconds>(deadline.remaining())));
        const auto status = window_->exitStatus(deadline);
        window_.reset();
        if (status == kExitYes)
            return PromptAnswer::Yes;
        if (status == kExitNo)
            return PromptAnswer::No;
        if (status == kExitTimeout || deadline.passed() || events_.stopRequested())
            return PromptAnswer::Unanswered;
    }
    return PromptAnswer::NotAsked;
}

void DialogPrompter::start(const std::vector<std::string>& arguments) {
    window_ = std::make_unique<ChildProgram>(events_, arguments);
}

void DialogPrompter::showProgress(const std::string& text, std::optional<std::uint32_t> percent) {
    if (kind_ == nullptr || kind_->progress == nullptr)
        return;
    if (!window_)
        start(kind_->progress(title_));
    // 100 would close the window, and something may still come.
    constexpr std::uint32_t kAlmost = 99;
    window_->write("# " + text + "\n" + (percent ? std::to_string(std::min(*percent, kAlmost)) + "\n" : ""));
}

void DialogPrompter::finish(const std::string& title, const std::string& message) {
    window_.reset();
    if (kind_ == nullptr || title.empty())
        return;
    start(kind_->notice(title, message));
    window_->release();
    window_.reset();
}

}  // namespace ventras
