#pragma once

#include <string>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// A real message bus (dbus-daemon) of a test's own, where everybody may own and call everything. While it
/// lives, it is this process's system bus and session bus. One thread at a time.
class PrivateBus {
public:
    /// Returns when the bus takes connections.
    /// @throw std::runtime_error when it does not.
    PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;
    ~PrivateBus();

    const std::string& address() const { return address_; }

    /// What a program needs in its environment to use this bus.
    Environment environment() const;

    /// Ends it, while connections to it may be open.
    void stop() { daemon_.end(); }

    /// Freezes it: connections are taken and nothing is ever answered.
    void suspend();
    void resume();

private:
    TemporaryFolder folder_;
    std::string address_;
    RunningProgram daemon_;
};

/// Waits for a service to take its name on the system bus of the environment.
/// @throw std::runtime_error, with what the program says, when it does not.
void waitForService(const char* name, const RunningProgram& program);

}  // namespace ventras
