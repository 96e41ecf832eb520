#pragma once

#include <memory>
#include <vector>

#include "platform/linux/installer/Prompter.h"

namespace ventras {

/// Several ways to talk to a person, the best first. The first that can put the question decides, and is the
/// one that shows what comes afterwards; a question that went away by itself is put by the next.
class PrompterChain : public Prompter {
public:
    explicit PrompterChain(std::vector<std::unique_ptr<Prompter>> prompters);

    PromptAnswer ask(const InstallQuestion& question, Deadline deadline) override;
    void showProgress(const std::string& text, std::optional<std::uint32_t> percent) override;
    void finish(const std::string& title, const std::string& message) override;

private:
    std::vector<std::unique_ptr<Prompter>> prompters_;
    Prompter* speaker_ = nullptr;
};

}  // namespace ventras
