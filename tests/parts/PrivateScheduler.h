#pragma once

#include <chrono>
#include <cstdint>
#include <filesystem>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Handles.h"
#include "tests/parts/Program.h"
#include "tests/parts/SchedulerFolder.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// A real CUPS scheduler in a folder of its own, ended and removed with its owner.
///
/// Its backends "ipp", "ipps" and "socket" are the system's; "usb", "ippusb", "riousb", "dnssd", "mdns" and
/// "lpd" lay each job down as a file. One thread at a time.
class PrivateScheduler {
public:
    /// Returns when the scheduler answers.
    /// @throw std::runtime_error, with the scheduler's log, when it does not.
    explicit PrivateScheduler(SchedulerOptions options = {});
    PrivateScheduler(const PrivateScheduler&) = delete;
    PrivateScheduler& operator=(const PrivateScheduler&) = delete;
    ~PrivateScheduler();

    /// What a program needs in its environment to use this scheduler and no other.
    Environment environment() const;

    /// The scheduler's address as CUPS_SERVER wants it, and its TCP port (0 = none).
    const std::string& address() const { return address_; }
    std::uint16_t port() const { return port_; }
    const std::filesystem::path& folder() const { return folder_.path(); }

    /// The names of all queues, in alphabetical order.
    std::vector<std::string> queues() const;

    /// A queue's attributes as text, one string a value; empty when there is no such queue.
    std::map<std::string, std::vector<std::string>> attributes(const std::string& queue) const;

    /// The first value of one attribute of a queue; empty when it has none.
    std::string attribute(const std::string& queue, const std::string& name) const;

    /// The PPD of a queue, byte for byte; empty for a raw queue.
    std::string ppd(const std::string& queue) const;

    /// Makes a queue, as another program would. An empty PPD makes a raw queue.
    void addQueue(const std::string& name, const std::string& deviceURI, std::string_view ppd = {}) const;
    void deleteQueue(const std::string& name) const;
    void setDefault(const std::string& name) const;

    /// Prints a file with `lp`. A bare file name means a test document.
    /// @param options for `lp -o`
    /// @return the job's number.
    /// @throw std::runtime_error when it is refused.
    int print(const std::string& queue, const std::filesystem::path& file,
              const std::vector<std::string>& options = {}) const;

    /// Where a job to one of the file-laying backends comes out; the file appears when it is complete.
    std::filesystem::path sinkFile(const std::string& queue, int job) const;

    /// Waits for a file to appear.
    static bool appears(const std::filesystem::path& file,
                        std::chrono::milliseconds limit = std::chrono::seconds(20));

    std::string errorLog() const;
    std::string accessLog() const;

    /// Ends the scheduler, politely; kill() gives it no chance to tidy up.
    void stop();
    void kill();
    /// Starts it again, in the same folder and at the same address.
    void start();

    /// Freezes it: connections are taken and never answered.
    void suspend();
    void resume();

    pid_t pid() const { return program_->pid(); }
    std::optional<uid_t> user() const { return options_.user; }

private:
    IppPtr request(IppPtr message, const char* resource, const char* ppdFile = nullptr) const;
    void requireSuccess(IppPtr message, const char* resource, const char* ppdFile = nullptr) const;
    bool answers() const;

    SchedulerOptions options_;
    TemporaryFolder folder_;
    std::uint16_t port_ = 0;
    std::filesystem::path socket_;
    std::string address_;
    std::unique_ptr<RunningProgram> program_;
};

/// Sends this process's own libcups calls to a private scheduler for as long as it lives: those of the thread
/// that makes it, and those of threads started later.
class UseScheduler {
public:
    explicit UseScheduler(const PrivateScheduler& scheduler);
    /// Sends them to an address where there need not be any scheduler.
    explicit UseScheduler(const std::string& address);
    UseScheduler(const UseScheduler&) = delete;
    UseScheduler& operator=(const UseScheduler&) = delete;
    ~UseScheduler();
};

}  // namespace ventras
