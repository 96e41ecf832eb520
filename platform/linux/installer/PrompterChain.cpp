#include "platform/linux/installer/PrompterChain.h"

#include <utility>

namespace ventras {

PrompterChain::PrompterChain(std::vector<std::unique_ptr<Prompter>> prompters)
    : prompters_(std::move(prompters)) {}

PromptAnswer PrompterChain::ask(const InstallQuestion& question, Deadline deadline) {
    for (const auto& prompter : prompters_) {
        if (deadline.passed())
            return PromptAnswer::Unanswered;
        const auto answer = prompter->ask(question, deadline);
        if (answer == PromptAnswer::NotAsked)
            continue;
        speaker_ = prompter.get();
        return answer;
    }
    return PromptAnswer::NotAsked;
}

void PrompterChain::showProgress(const std::string& text, std::optional<std::uint32_t> percent) {
    if (speaker_ != nullptr)
        speaker_->showProgress(text, percent);
}

void PrompterChain::finish(const std::string& title, const std::string& message) {
    if (speaker_ != nullptr)
        speaker_->finish(title, message);
}

}  // namespace ventras
