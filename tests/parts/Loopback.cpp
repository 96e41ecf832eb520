#include "tests/parts/Loopback.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <random>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace ventras {
namespace {

// Below the usual net.ipv4.ip_local_port_range, so that no outgoing connection takes the port meanwhile.
constexpr std::uint16_t kFirstPort = 20000;
constexpr std::uint16_t kLastPort = 32000;

struct SocketAddress {
    sockaddr_storage storage{};
    socklen_t length = 0;
    int family = AF_INET;
    const sockaddr* pointer() const { return reinterpret_cast<const sockaddr*>(&storage); }
};

SocketAddress socketAddress(LoopbackAddress address, std::uint16_t port) {
    SocketAddress result;
    if (address == LoopbackAddress::v4) {
        auto& v4 = reinterpret_cast<sockaddr_in&>(result.storage);
        v4.sin_family = AF_INET;
        v4.sin_port = htons(port);
        v4.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        result.length = sizeof v4;
        return result;
    }
    auto& v6 = reinterpret_cast<sockaddr_in6&>(result.storage);
    v6.sin6_family = AF_INET6;
    v6.sin6_port = htons(port);
    v6.sin6_addr = in6addr_loopback;
    result.length = sizeof v6;
    result.family = AF_INET6;
    return result;
}

bool isFree(std::uint16_t port) {
    try {
        const ListeningSocket v4(LoopbackAddress::v4, port);
        const ListeningSocket v6(LoopbackAddress::v6, port);
        return true;
    } catch (const std::system_error&) {
        return false;
    }
}

}  // namespace

ListeningSocket::ListeningSocket(LoopbackAddress address, std::uint16_t port, int backlog) {
    const auto target = socketAddress(address, port);
    descriptor_ = socket(target.family, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const int on = 1;
    setsockopt(descriptor_, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
    if (bind(descriptor_, target.pointer(), target.length) == 0 && listen(descriptor_, backlog) == 0)
        return;
    const int error = errno;
    close(descriptor_);
    throw std::system_error(error, std::generic_category(), "port " + std::to_string(port));
}

ListeningSocket::ListeningSocket(ListeningSocket&& other) noexcept
    : descriptor_(std::exchange(other.descriptor_, -1)) {}

ListeningSocket& ListeningSocket::operator=(ListeningSocket&& other) noexcept {
    std::swap(descriptor_, other.descriptor_);
    return *this;
}

ListeningSocket::~ListeningSocket() {
    if (descriptor_ >= 0)
        close(descriptor_);
}

std::uint16_t ListeningSocket::port() const {
    sockaddr_storage own{};
    socklen_t length = sizeof own;
    getsockname(descriptor_, reinterpret_cast<sockaddr*>(&own), &length);
    // Both families keep the port at the same place.
    return ntohs(reinterpret_cast<const sockaddr_in&>(own).sin_port);
}

std::uint16_t freePort() {
    std::random_device random;
    std::uniform_int_distribution<int> ports(kFirstPort, kLastPort);
    for (int attempt = 0; attempt < 1000; ++attempt)
        if (const auto port = static_cast<std::uint16_t>(ports(random)); isFree(port))
            return port;
    throw std::runtime_error("no free TCP port");
}

int connectToLoopback(LoopbackAddress address, std::uint16_t port) {
    const auto target = socketAddress(address, port);
    const int descriptor = socket(target.family, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (connect(descriptor, target.pointer(), target.length) == 0)
        return descriptor;
    close(descriptor);
    return -1;
}

}  // namespace ventras
