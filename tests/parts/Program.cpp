#include "tests/parts/Program.h"

#include <fcntl.h>
#include <poll.h>
#include <pwd.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <system_error>

#include "platform/linux/ArgumentPointers.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

// How long a program may take to follow SIGTERM before its whole group is killed.
constexpr auto kPoliteness = 3s;

[[noreturn]] void fail(int error, const std::string& what) {
    throw std::system_error(error, std::generic_category(), what);
}

// Output goes to memory instead of pipes: nobody has to read while the program runs.
int memoryFile(const char* name, const std::string& content = {}) {
    const int file = memfd_create(name, MFD_CLOEXEC);
    if (file < 0 || write(file, content.data(), content.size()) != static_cast<ssize_t>(content.size()))
        fail(errno, "memfd_create");
    lseek(file, 0, SEEK_SET);
    return file;
}

std::string contentOf(int file) {
    struct stat status {};
    fstat(file, &status);
    std::string content(static_cast<std::size_t>(status.st_size), '\0');
    const auto length = pread(file, content.data(), content.size(), 0);
    content.resize(length < 0 ? 0 : static_cast<std::size_t>(length));
    return content;
}

// As JOURNAL_STREAM names a stream: systemd.exec(5).
std::string identityOf(int file) {
    struct stat status {};
    fstat(file, &status);
    return std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
}

// A server must not outlive a test that crashed: setpriv ties it to the thread that started it.
std::vector<std::string> tied(const std::vector<std::string>& arguments, const ProgramOptions& options) {
    std::vector<std::string> all{"setpriv", "--pdeathsig", "KILL"};
    if (options.user) {
        const passwd* user = getpwuid(*options.user);
        const gid_t group = user != nullptr ? user->pw_gid : *options.user;
        all.insert(all.end(), {"--reuid=" + std::to_string(*options.user), "--regid=" + std::to_string(group),
                               "--clear-groups"});
    }
    all.emplace_back("--");
    all.insert(all.end(), arguments.begin(), arguments.end());
    return all;
}

std::vector<std::string> completeEnvironment(const Environment& additions) {
    Environment all;
    for (char** entry = environ; *entry != nullptr; ++entry) {
        const std::string text = *entry;
        const auto equals = text.find('=');
        all[text.substr(0, equals)] = equals == std::string::npos ? "" : text.substr(equals + 1);
    }
    all["PATH"] += ":/usr/sbin:/sbin";
    for (const auto& [name, value] : additions)
        all[name] = value;
    std::vector<std::string> list;
    for (const auto& [name, value] : all)
        list.push_back(name + "=" + value);
    return list;
}

class SpawnSettings {
public:
    SpawnSettings(const std::array<int, 3>& descriptors, const std::string& workingFolder) {
        posix_spawn_file_actions_init(&actions);
        for (int i = 0; i < 3; ++i)
            posix_spawn_file_actions_adddup2(&actions, descriptors[static_cast<std::size_t>(i)], i);
        posix_spawn_file_actions_addclosefrom_np(&actions, 3);
        if (!workingFolder.empty())
            posix_spawn_file_actions_addchdir_np(&actions, workingFolder.c_str());

        sigset_t none;
        sigset_t broken;
        sigemptyset(&none);
        sigemptyset(&broken);
        sigaddset(&broken, SIGPIPE);
        posix_spawnattr_init(&attributes);
        posix_spawnattr_setpgroup(&attributes, 0);
        posix_spawnattr_setsigmask(&attributes, &none);
        posix_spawnattr_setsigdefault(&attributes, &broken);
        posix_spawnattr_setflags(&attributes,
                                 POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    }
    SpawnSettings(const SpawnSettings&) = delete;
    SpawnSettings& operator=(const SpawnSettings&) = delete;
    ~SpawnSettings() {
        posix_spawn_file_actions_destroy(&actions);
        posix_spawnattr_destroy(&attributes);
    }

    posix_spawn_file_actions_t actions{};
    posix_spawnattr_t attributes{};
};

}  // namespace

Environment together(std::initializer_list<Environment> parts) {
    Environment all;
    for (const auto& part : parts)
        all.insert(part.begin(), part.end());
    return all;
}

RunningProgram::RunningProgram(const std::vector<std::string>& arguments, const ProgramOptions& options)
    : started_(std::chrono::steady_clock::now()) {
    const int input = memoryFile("input", options.standardInput);
    output_ = memoryFile("output");
    error_ = memoryFile("error");
    auto argumentStrings = tied(arguments, options);
    auto environment = options.environment;
    if (options.errorsGoToJournal)
        environment["JOURNAL_STREAM"] = identityOf(error_);
    auto environmentStrings = completeEnvironment(environment);
    const SpawnSettings settings({input, output_, error_}, options.workingFolder);
    const int failed =
        posix_spawnp(&pid_, "setpriv", &settings.actions, &settings.attributes,
                     argumentPointers(argumentStrings).data(), argumentPointers(environmentStrings).data());
    close(input);
    if (failed != 0)
        fail(failed, arguments.at(0));
    processDescriptor_ = static_cast<int>(syscall(SYS_pidfd_open, pid_, 0));
}

RunningProgram::~RunningProgram() {
    end();
    close(processDescriptor_);
    close(output_);
    close(error_);
}

void RunningProgram::signal(int number) {
    if (!ended_)
        kill(pid_, number);
}

bool RunningProgram::waitUntilEnded(std::chrono::milliseconds limit) {
    if (ended_)
        return true;
    pollfd descriptor{processDescriptor_, POLLIN, 0};
    if (poll(&descriptor, 1, static_cast<int>(limit.count())) <= 0)
        return false;
    int status = 0;
    rusage usage{};
    wait4(pid_, &status, 0, &usage);
    collect(status, usage.ru_maxrss);
    return true;
}

void RunningProgram::end() {
    if (!isRunning())
        return;
    signal(SIGTERM);
    signal(SIGCONT);
    if (waitUntilEnded(kPoliteness))
        return;
    kill(-pid_, SIGKILL);
    signal(SIGKILL);
    waitUntilEnded(-1ms);
}

void RunningProgram::collect(int status, long peakKilobytes) {
    ended_ = true;
    result_.wallTime =
        std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - started_);
    result_.exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    result_.signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    result_.peakKilobytes = peakKilobytes;
}

std::string RunningProgram::standardOutput() const {
    return contentOf(output_);
}

std::string RunningProgram::standardError() const {
    return contentOf(error_);
}

ProgramResult RunningProgram::result() const {
    ProgramResult result = result_;
    result.standardOutput = standardOutput();
    result.standardError = standardError();
    return result;
}

ProgramResult runProgram(const std::vector<std::string>& arguments, const ProgramOptions& options,
                         std::chrono::milliseconds limit) {
    RunningProgram program(arguments, options);
    const bool inTime = program.waitUntilEnded(limit);
    program.end();
    ProgramResult result = program.result();
    result.timedOut = !inTime;
    return result;
}

}  // namespace ventras
