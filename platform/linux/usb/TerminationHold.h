#pragma once

namespace ventras {

/// While one lives, a request to end the process (SIGHUP, SIGINT, SIGTERM) waits, so that a device that is in
/// use can be given back first; with the last one it takes its usual way. Whoever holds must look often, and
/// hurry. Any thread may make one; several may live at once.
class TerminationHold {
public:
    TerminationHold();
    TerminationHold(const TerminationHold&) = delete;
    TerminationHold& operator=(const TerminationHold&) = delete;
    ~TerminationHold();

    /// Whether the process is wanted to end.
    static bool requested();
};

}  // namespace ventras
