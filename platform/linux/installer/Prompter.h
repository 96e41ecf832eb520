#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/Deadline.h"
#include "platform/linux/installer/InstallQuestion.h"

namespace ventras {

/// What came of a question.
enum class PromptAnswer {
    Yes,
    No,
    Unanswered,  ///< it was put, and nobody answered it: in time, or before taking it away
    NotAsked     ///< it could not be put, or went away by itself: somebody else may ask
};

/// One way to talk to the person at this computer. It belongs to the worker thread that makes it.
class Prompter {
public:
    virtual ~Prompter() = default;

    /// Asks, and waits for the answer. Nothing but an explicit yes is a yes.
    /// @param deadline after which the question is taken away
    virtual PromptAnswer ask(const InstallQuestion& question, Deadline deadline) = 0;

    /// Shows how far something is, in place of what was shown before.
    /// @param percent absent when it is not known
    virtual void showProgress(const std::string& text, std::optional<std::uint32_t> percent) = 0;

    /// Takes the progress away, and says how it ended; says nothing when the title is empty. Waits for
    /// nobody.
    virtual void finish(const std::string& title, const std::string& message) = 0;
};

}  // namespace ventras
