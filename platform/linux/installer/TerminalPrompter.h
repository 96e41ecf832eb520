#pragma once

#include <unistd.h>

#include "platform/linux/installer/EventContext.h"
#include "platform/linux/installer/Prompter.h"

namespace ventras {

/// Asks on the terminal that the program was started from, when it stands in the foreground there. Only a
/// line that says yes is a yes.
class TerminalPrompter : public Prompter {
public:
    /// @param input, output file descriptors of the terminal; others are never asked
    explicit TerminalPrompter(EventContext& events, int input = STDIN_FILENO, int output = STDOUT_FILENO)
        : events_(events), input_(input), output_(output) {}

    PromptAnswer ask(const InstallQuestion& question, Deadline deadline) override;
    void showProgress(const std::string& text, std::optional<std::uint32_t> percent) override;
    void finish(const std::string& title, const std::string& message) override;

private:
    bool isTerminalOurs() const;
    void write(const std::string& text) const;

    EventContext& events_;
    int input_;
    int output_;
    bool isProgressShown_ = false;
};

}  // namespace ventras
