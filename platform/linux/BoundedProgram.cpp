#include "platform/linux/BoundedProgram.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <string_view>

#include "platform/Deadline.h"
#include "platform/linux/ArgumentPointers.h"
#include "platform/linux/FileDescriptor.h"

namespace ventras {
namespace {

constexpr std::size_t kMostOutput = std::size_t{64} * 1024 * 1024;

struct Pipe {
    FileDescriptor reading, writing;
};

std::optional<Pipe> makePipe() {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0)
        return std::nullopt;
    return Pipe{FileDescriptor(ends[0]), FileDescriptor(ends[1])};
}

/// What posix_spawn() is told: output to a pipe, no input, a process group of its own.
class SpawnSettings {
public:
    explicit SpawnSettings(int output) {
        posix_spawn_file_actions_init(&actions_);
        posix_spawn_file_actions_addopen(&actions_, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_adddup2(&actions_, output, STDOUT_FILENO);
        posix_spawnattr_init(&attributes_);
        posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETPGROUP);
        posix_spawnattr_setpgroup(&attributes_, 0);
    }
    SpawnSettings(const SpawnSettings&) = delete;
    SpawnSettings& operator=(const SpawnSettings&) = delete;
    ~SpawnSettings() {
        posix_spawn_file_actions_destroy(&actions_);
        posix_spawnattr_destroy(&attributes_);
    }

    /// @return the process, or -1.
    pid_t spawn(std::vector<char*>& arguments, std::vector<char*>& environment) {
        pid_t process = -1;
        const int error = posix_spawnp(&process, arguments.front(), &actions_, &attributes_, arguments.data(),
                                       environment.data());
        return error == 0 ? process : -1;
    }

private:
    posix_spawn_file_actions_t actions_{};
    posix_spawnattr_t attributes_{};
};

std::vector<std::string> environmentWith(const std::map<std::string, std::string>& variables) {
    std::vector<std::string> environment;
    for (const auto& [name, value] : variables)
        environment.push_back(name + "=" + value);
    for (char** entry = environ; *entry != nullptr; ++entry) {
        const std::string_view text = *entry;
        if (!variables.contains(std::string(text.substr(0, text.find('=')))))
            environment.emplace_back(text);
    }
    return environment;
}

bool waitFor(int descriptor, const Deadline& deadline) {
    pollfd waiting{.fd = descriptor, .events = POLLIN, .revents = 0};
    return poll(&waiting, 1, static_cast<int>(deadline.remaining().count())) == 1;
}

/// Everything until the end of the output; absent when there is no end in time, or too much.
std::optional<std::string> readAll(int descriptor, const Deadline& deadline) {
    std::string text;
    std::array<char, 65536> buffer{};
    while (text.size() <= kMostOutput && waitFor(descriptor, deadline)) {
        const auto count = read(descriptor, buffer.data(), buffer.size());
        if (count < 0)
            return std::nullopt;
        if (count == 0)
            return text;
        text.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return std::nullopt;
}

/// Waits for the process's end, and makes it where it does not come. @return whether it came, with success.
bool endedWell(pid_t process, bool isWanted, const Deadline& deadline) {
    // glibc 2.36 declares pidfd_open() without C linkage.
    const FileDescriptor handle{static_cast<int>(syscall(SYS_pidfd_open, process, 0))};
    if (!isWanted || handle.get() < 0 || !waitFor(handle.get(), deadline))
        kill(-process, SIGKILL);
    int status = 0;
    return waitpid(process, &status, 0) == process && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

}  // namespace

std::optional<std::string> outputOf(const std::vector<std::string>& arguments,
                                    const std::map<std::string, std::string>& variables,
                                    std::chrono::milliseconds limit) {
    auto pipe = makePipe();
    if (!pipe || arguments.empty())
        return std::nullopt;
    auto words = arguments;
    auto environment = environmentWith(variables);
    auto wordPointers = argumentPointers(words);
    auto environmentPointers = argumentPointers(environment);
    const auto deadline = Deadline::after(limit);
    const pid_t process = SpawnSettings(pipe->writing.get()).spawn(wordPointers, environmentPointers);
    if (process < 0)
        return std::nullopt;
    pipe->writing = FileDescriptor();
    auto output = readAll(pipe->reading.get(), deadline);
    return endedWell(process, output.has_value(), deadline) ? std::move(output) : std::nullopt;
}

}  // namespace ventras
