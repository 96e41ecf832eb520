#include "platform/linux/installer/ChildProgram.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "platform/linux/ArgumentPointers.h"

namespace ventras {

ChildProgram::ChildProgram(EventContext& events, std::vector<std::string> arguments) : events_(events) {
    auto words = argumentPointers(arguments);
    constexpr auto kFlags = static_cast<GSpawnFlags>(G_SPAWN_SEARCH_PATH | G_SPAWN_DO_NOT_REAP_CHILD |
                                                     G_SPAWN_STDOUT_TO_DEV_NULL | G_SPAWN_STDERR_TO_DEV_NULL);
    int input = -1;
    if (g_spawn_async_with_pipes(nullptr, words.data(), nullptr, kFlags, nullptr, nullptr, &process_, &input,
                                 nullptr, nullptr, nullptr) == FALSE)
        return;
    input_ = FileDescriptor(input);
    fcntl(input, F_SETFL, O_NONBLOCK);
    fcntl(input, F_SETFD, FD_CLOEXEC);
    // glibc 2.36 declares pidfd_open() without C linkage.
    handle_ = FileDescriptor(static_cast<int>(syscall(SYS_pidfd_open, process_, 0)));
}

ChildProgram::~ChildProgram() {
    if (process_ < 0)
        return;
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
}

std::optional<int> ChildProgram::exitStatus(Deadline deadline) {
    if (process_ < 0 || handle_.get() < 0 || !events_.waitUntilReadable(handle_.get(), deadline))
        return std::nullopt;
    int status = 0;
    const bool isCollected = waitpid(process_, &status, 0) == process_;
    process_ = -1;
    return isCollected && WIFEXITED(status) ? std::optional{WEXITSTATUS(status)} : std::nullopt;
}

void ChildProgram::write(const std::string& text) const {
    // Progress that a full pipe does not take is followed by newer progress.
    [[maybe_unused]] const auto written = ::write(input_.get(), text.data(), text.size());
}

}  // namespace ventras
