#include "tests/platform-linux/PrivateBus.h"

#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include <array>
#include <csignal>
#include <cstdlib>
#include <stdexcept>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/desktop/DBusCall.h"
#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

constexpr std::array kVariables{"DBUS_SYSTEM_BUS_ADDRESS", "DBUS_SESSION_BUS_ADDRESS"};

std::string configuration(const std::string& address) {
    return R"(<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>system</type>
  <listen>)" +
           address + R"(</listen>
  <auth>EXTERNAL</auth>
  <policy context="default">
    <allow user="*"/>
    <allow own="*"/>
    <allow send_destination="*" eavesdrop="false"/>
    <allow receive_sender="*" eavesdrop="false"/>
  </policy>
</busconfig>
)";
}

bool takesConnections(const std::filesystem::path& path) {
    sockaddr_un address{.sun_family = AF_UNIX, .sun_path = {}};
    path.string().copy(address.sun_path, sizeof address.sun_path - 1);
    const FileDescriptor socket{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
    return connect(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
}

void waitForBus(const std::filesystem::path& socket) {
    using namespace std::chrono_literals;
    if (!comesTrue([&] { return takesConnections(socket); }, 5s))
        throw std::runtime_error("no bus at " + socket.string());
}

}  // namespace

PrivateBus::PrivateBus()
    : address_("unix:path=" + (folder_ / "bus").string()),
      daemon_({"dbus-daemon", "--nofork", "--nopidfile",
               "--config-file=" + folder_.write("bus.conf", configuration(address_)).string()}) {
    chmod(folder_.path().c_str(), 0755);  // programs of other users come here
    waitForBus(folder_ / "bus");
    for (const auto* variable : kVariables)
        setenv(variable, address_.c_str(), 1);
}

PrivateBus::~PrivateBus() {
    for (const auto* variable : kVariables)
        unsetenv(variable);
    daemon_.signal(SIGCONT);
}

Environment PrivateBus::environment() const {
    Environment environment;
    for (const auto* variable : kVariables)
        environment.emplace(variable, address_);
    return environment;
}

void PrivateBus::suspend() {
    daemon_.signal(SIGSTOP);
}

void PrivateBus::resume() {
    daemon_.signal(SIGCONT);
}

void waitForService(const char* name, const RunningProgram& program) {
    using namespace std::chrono_literals;
    constexpr DBusMethod kHasOwner{Bus::System, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                   "org.freedesktop.DBus", "NameHasOwner"};
    const auto isThere = [&] {
        const auto answer = callDBus(kHasOwner, g_variant_new("(s)", name), "(b)", 2s);
        gboolean hasOwner = FALSE;
        if (answer.reply)
            g_variant_get(answer.reply.get(), "(b)", &hasOwner);
        return hasOwner != FALSE;
    };
    if (!comesTrue(isThere, 10s))
        throw std::runtime_error(std::string("no ") + name + ": " + program.standardError());
}

}  // namespace ventras
