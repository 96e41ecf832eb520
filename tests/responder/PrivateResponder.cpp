#include "tests/responder/PrivateResponder.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <string_view>
#include <thread>
#include <vector>

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr auto kStartLimit = 10s;
constexpr std::string_view kAddressPrefix = "unix:path=";

constexpr std::string_view kBusPolicy = R"(</listen><auth>EXTERNAL</auth>
<policy context="default">
  <allow user="*"/><allow own="*"/><allow send_destination="*"/><allow send_type="method_call"/>
  <allow receive_sender="*"/>
</policy></busconfig>
)";

constexpr std::string_view kDaemonSettings = R"([server]
host-name=testhost
use-ipv6=no
allow-interfaces=lo,other
[wide-area]
enable-wide-area=no
[publish]
publish-hinfo=no
publish-workstation=no
publish-addresses=no
)";

std::string busAddress() {
    const char* address = std::getenv("DBUS_SYSTEM_BUS_ADDRESS");
    if (address == nullptr || !std::string_view(address).starts_with(kAddressPrefix))
        throw std::runtime_error("this program's main() has not set the bus's address");
    return address;
}

// The socket's file is there a moment before anybody listens.
bool acceptsConnections(const std::filesystem::path& path) {
    const int client = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.native().copy(address.sun_path, sizeof address.sun_path - 1);
    const bool accepted = connect(client, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
    close(client);
    return accepted;
}

}  // namespace

PrivateResponder::PrivateResponder() {
    startBus();
    startDaemon();
    try {
        publisher_ = std::make_unique<ServicePublisher>();
    } catch (const std::exception& error) {
        throw std::runtime_error(error.what() + ("\n" + bus_->standardError()) + log());
    }
}

PrivateResponder::~PrivateResponder() {
    resume();
    publisher_.reset();
}

void PrivateResponder::startBus() {
    const auto address = busAddress();
    const std::filesystem::path socket = address.substr(kAddressPrefix.size());
    std::filesystem::remove(socket);  // a bus that was killed leaves its own
    const auto configuration = folder_.write(
        "bus.conf", "<busconfig><type>system</type><listen>" + address + std::string(kBusPolicy));
    bus_ = std::make_unique<RunningProgram>(std::vector<std::string>{
        "dbus-daemon", "--config-file=" + configuration.string(), "--nofork", "--nopidfile"});
    const auto giveUp = std::chrono::steady_clock::now() + kStartLimit;
    while (!acceptsConnections(socket)) {
        if (!bus_->isRunning() || std::chrono::steady_clock::now() > giveUp)
            throw std::runtime_error("no message bus: " + bus_->standardError());
        std::this_thread::sleep_for(2ms);
    }
}

void PrivateResponder::startDaemon() {
    const auto settings = folder_.write("avahi.conf", kDaemonSettings);
    daemon_ = std::make_unique<RunningProgram>(
        std::vector<std::string>{"avahi-daemon", "--no-drop-root", "--no-chroot", "--no-rlimits",
                                 "--no-proc-title", "-f", settings.string()});
}

void PrivateResponder::kill() {
    daemon_->signal(SIGKILL);
    daemon_->waitUntilEnded(kStartLimit);
}

void PrivateResponder::killBus() {
    bus_->signal(SIGKILL);
    bus_->waitUntilEnded(kStartLimit);
}

}  // namespace ventras
