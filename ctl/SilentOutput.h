#pragma once

namespace ventras {

/// Sends standard output nowhere for as long as it lives: the agent's own status lines do not belong into a
/// report about it. Not for two threads at once.
class SilentOutput {
public:
    SilentOutput();
    SilentOutput(const SilentOutput&) = delete;
    SilentOutput& operator=(const SilentOutput&) = delete;
    ~SilentOutput();

private:
    int saved_;
};

}  // namespace ventras
