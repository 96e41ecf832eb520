#pragma once

#include <memory>
#include <string>
#include <vector>

#include "platform/linux/installer/ChildProgram.h"
#include "platform/linux/installer/EventContext.h"
#include "platform/linux/installer/Prompter.h"

namespace ventras {

/// Asks by a window of zenity or kdialog, whichever is installed, where there is a screen to put it on. Only
/// zenity shows progress, because kdialog's window for that is driven from outside.
class DialogPrompter : public Prompter {
public:
    explicit DialogPrompter(EventContext& events) : events_(events) {}

    PromptAnswer ask(const InstallQuestion& question, Deadline deadline) override;
    void showProgress(const std::string& text, std::optional<std::uint32_t> percent) override;
    void finish(const std::string& title, const std::string& message) override;

    /// Programs for windows, as they are known here.
    struct Kind;

private:
    void start(const std::vector<std::string>& arguments);

    EventContext& events_;
    const Kind* kind_ = nullptr;  // the one that asked
    std::string title_;
    std::unique_ptr<ChildProgram> window_;
};

}  // namespace ventras
