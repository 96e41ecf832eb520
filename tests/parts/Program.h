#pragma once

#include <sys/types.h>

#include <chrono>
#include <initializer_list>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace ventras {

/// Variables for a program, on top of the test's own environment.
using Environment = std::map<std::string, std::string>;

/// The variables of all parts; one that several have is as in the first of them.
Environment together(std::initializer_list<Environment> parts);

/// How a program is to run.
struct ProgramOptions {
    Environment environment = {};
    std::optional<uid_t> user = {};  ///< as this user and its group; needs root
    std::string standardInput = {};
    std::string workingFolder = {};  ///< empty: the test's own
    /// Tells it, as a service manager does, that its standard error is kept in a journal.
    bool errorsGoToJournal = false;
};

/// What a finished program left behind.
struct ProgramResult {
    int exitStatus = -1;  ///< -1 when a signal ended it
    int signal = 0;       ///< the signal that ended it, or 0
    std::string standardOutput;
    std::string standardError;
    std::chrono::milliseconds wallTime{};
    long peakKilobytes = 0;  ///< largest resident size; never below that of the test program that started it
    bool timedOut = false;   ///< the test ended it because its time was up
};

/// A program in the background. Its end is the end of this object, or of the thread that started it.
/// One thread at a time.
class RunningProgram {
public:
    /// Starts `arguments[0]`, looked up in PATH and the administrator's folders.
    /// @throw std::system_error when it cannot be started.
    explicit RunningProgram(const std::vector<std::string>& arguments, const ProgramOptions& options = {});
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;
    ~RunningProgram();

    pid_t pid() const { return pid_; }
    bool isRunning() { return !waitUntilEnded(std::chrono::milliseconds(0)); }

    /// Sends a signal, while it runs.
    void signal(int number);

    /// Waits for its own end.
    /// @return false when it still runs after `limit`.
    bool waitUntilEnded(std::chrono::milliseconds limit);

    /// Ends it, politely first, and with it the processes of its group.
    void end();

    /// Everything that it wrote so far.
    std::string standardOutput() const;
    std::string standardError() const;

    /// What it left behind, once it has ended.
    ProgramResult result() const;

private:
    void collect(int status, long peakKilobytes);

    pid_t pid_ = -1;
    int processDescriptor_ = -1;
    int output_ = -1;
    int error_ = -1;
    bool ended_ = false;
    std::chrono::steady_clock::time_point started_;
    ProgramResult result_;
};

/// Runs a program to its end, which comes after `limit` at the latest.
ProgramResult runProgram(const std::vector<std::string>& arguments, const ProgramOptions& options = {},
                         std::chrono::milliseconds limit = std::chrono::seconds(60));

}  // namespace ventras
