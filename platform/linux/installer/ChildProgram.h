#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/installer/EventContext.h"

namespace ventras {

/// A program that was started, without a shell; its output goes nowhere. It ends with its owner. It belongs
/// to the thread of the EventContext.
class ChildProgram {
public:
    /// @param arguments the first is the program's name, looked up in PATH
    ChildProgram(EventContext& events, std::vector<std::string> arguments);
    ChildProgram(const ChildProgram&) = delete;
    ChildProgram& operator=(const ChildProgram&) = delete;
    ~ChildProgram();

    /// Waits for its end.
    /// @return its exit status; absent when it could not be started, runs on, or was ended by a signal.
    std::optional<int> exitStatus(Deadline deadline);

    /// Writes to its standard input, unless it does not read. The process has to ignore SIGPIPE.
    void write(const std::string& text) const;

    /// Lets it live on without its owner.
    void release() { process_ = -1; }

private:
    EventContext& events_;
    pid_t process_ = -1;  // -1 = none to wait for
    FileDescriptor handle_;
    FileDescriptor input_;
};

}  // namespace ventras
