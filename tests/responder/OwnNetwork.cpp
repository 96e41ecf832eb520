#include "tests/responder/OwnNetwork.h"

#include <fcntl.h>
#include <grp.h>
#include <net/if.h>
#include <pwd.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "platform/linux/ArgumentPointers.h"
#include "tests/parts/Program.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

// Says to the program started anew where it is.
constexpr const char* kMarker = "VENTRAS_OWN_NETWORK";

// With root's rights, or else with those that an ordinary user has in a user namespace of its own, where it
// stays the user that it is: a scheduler that took itself for root would refuse filters that are not root's.
const std::vector<std::string> kWays[] = {
    {"unshare", "--net", "--mount", "--"},
    {"unshare", "--user", "--map-current-user", "--keep-caps", "--net", "--mount", "--"},
};

// The responder's own folder; the path is compiled into it.
const fs::path kRunFolder = "/run/avahi-daemon";

[[noreturn]] void fail(const std::string& what) {
    throw std::runtime_error("no network of its own for the responder: " + what);
}

void requireZero(int result, const std::string& what) {
    if (result != 0)
        fail(what + ": " + std::strerror(errno));
}

void raiseLoopback() {
    const int control = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    ifreq request{};
    std::strcpy(request.ifr_name, "lo");
    request.ifr_flags = IFF_UP | IFF_RUNNING;
    const int result = ioctl(control, SIOCSIFFLAGS, &request);
    close(control);
    requireZero(result, "loopback");
}

bool giveToResponder(const fs::path& folder) {
    const passwd* user = getpwnam("avahi");
    const group* group = getgrnam("avahi");
    return user != nullptr && group != nullptr && chown(folder.c_str(), user->pw_uid, group->gr_gid) == 0;
}

// The responder insists on a folder of its own user's. An ordinary user's namespace has one user, so there
// that user is the responder's as well.
void bindFile(const fs::path& target, const std::string& content) {
    const auto file = fs::path("/run") / target.filename();
    std::ofstream(file) << content;
    requireZero(mount(file.c_str(), target.c_str(), nullptr, MS_BIND, nullptr), target);
}

void furnish() {
    requireZero(mount("tmpfs", "/run", "tmpfs", 0, "mode=755"), "/run");
    raiseLoopback();
    fs::create_directory(kRunFolder);
    if (giveToResponder(kRunFolder))
        return;
    const auto user = ":x:" + std::to_string(geteuid()) + ":";
    const auto group = std::to_string(getegid()) + ":";
    bindFile("/etc/passwd", "root:x:0:0::/:/bin/sh\navahi" + user + group + ":/:/bin/sh\n");
    bindFile("/etc/group", "root:x:0:\navahi:x:" + group + "\nnetdev:x:" + group + "\n");
    if (!giveToResponder(kRunFolder))
        fail(kRunFolder);
}

// The folder doubles as the lock: there can be but one responder at a time.
void stayInPlace() {
    if (getuid() != 0)
        fail("unshare is refused");
    fs::create_directories(kRunFolder);
    if (!giveToResponder(kRunFolder))
        fail(kRunFolder);
    requireZero(flock(open(kRunFolder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC), LOCK_EX), "lock");
}

void runAnew(std::vector<std::string> command, char* arguments[]) {
    command.emplace_back(fs::read_symlink("/proc/self/exe"));
    for (char** argument = arguments + 1; *argument != nullptr; ++argument)
        command.emplace_back(*argument);
    const auto pointers = argumentPointers(command);
    setenv(kMarker, "1", 1);
    execvp(pointers.front(), pointers.data());
    fail(command.front() + ": " + std::strerror(errno));
}

}  // namespace

void enterOwnNetwork(char* arguments[]) {
    if (const char* marker = std::getenv(kMarker); marker != nullptr && *marker != '\0') {
        furnish();
        return;
    }
    for (const auto& way : kWays) {
        auto trial = way;
        trial.insert(trial.end(), {"mount", "-t", "tmpfs", "tmpfs", "/run"});
        if (runProgram(trial).exitStatus == 0)
            runAnew(way, arguments);
    }
    stayInPlace();
}

}  // namespace ventras
