#include "bench/TimedProgram.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <stdexcept>

#include "platform/linux/ArgumentPointers.h"

namespace ventras {
namespace {

// Where a program's standard error goes, for the day that it fails.
class Complaints {
public:
    Complaints() : file_(memfd_create("complaints", MFD_CLOEXEC)) {}
    Complaints(const Complaints&) = delete;
    Complaints& operator=(const Complaints&) = delete;
    ~Complaints() { close(file_); }

    int file() const { return file_; }
    std::string text() const {
        std::string text(2000, '\0');
        const auto length = pread(file_, text.data(), text.size(), 0);
        text.resize(length < 0 ? 0 : static_cast<std::size_t>(length));
        return text;
    }

private:
    int file_;
};

class Outlets {
public:
    explicit Outlets(int complaints) {
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
        posix_spawn_file_actions_adddup2(&actions, complaints, STDERR_FILENO);
    }
    Outlets(const Outlets&) = delete;
    Outlets& operator=(const Outlets&) = delete;
    ~Outlets() { posix_spawn_file_actions_destroy(&actions); }

    posix_spawn_file_actions_t actions{};
};

}  // namespace

Cost timedRun(const std::vector<std::string>& arguments) {
    auto words = arguments;
    const auto list = argumentPointers(words);

    Complaints complaints;
    const Outlets outlets(complaints.file());
    pid_t pid = 0;
    int status = 0;
    rusage usage{};
    const auto start = std::chrono::steady_clock::now();
    if (posix_spawnp(&pid, list[0], &outlets.actions, nullptr, list.data(), environ) != 0)
        throw std::runtime_error("cannot start " + arguments[0]);
    wait4(pid, &status, 0, &usage);
    const std::chrono::duration<double, std::milli> elapsed = std::chrono::steady_clock::now() - start;
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0)
        throw std::runtime_error(arguments[0] + " failed with wait status " + std::to_string(status) + ": " +
                                 complaints.text());
    constexpr double kKibibytesPerMebibyte = 1024;
    return {elapsed.count(), static_cast<double>(usage.ru_maxrss) / kKibibytesPerMebibyte};
}

}  // namespace ventras
