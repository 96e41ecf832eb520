#include "platform/ConnectFailure.h"

#include <netdb.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <system_error>

namespace ventras {
namespace {

// A refusal comes at once; whoever is silent for so long has timed out before.
constexpr int kPatienceInMilliseconds = 500;

int errorOfPending(int socket) {
    pollfd descriptor{socket, POLLOUT, 0};
    if (poll(&descriptor, 1, kPatienceInMilliseconds) <= 0)
        return ETIMEDOUT;
    int error = 0;
    socklen_t length = sizeof error;
    getsockopt(socket, SOL_SOCKET, SO_ERROR, &error, &length);
    return error;
}

int errorOfConnecting(const sockaddr* address, socklen_t length) {
    const int descriptor = socket(address->sa_family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (descriptor < 0)
        return errno;
    int error = connect(descriptor, address, length) == 0 ? 0 : errno;
    if (error == EINPROGRESS)
        error = errorOfPending(descriptor);
    close(descriptor);
    return error;
}

std::string textOf(int error) {
    return error == 0 ? "it does not speak TLS" : std::generic_category().message(error);
}

std::string socketFailure(const std::string& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path)
        return textOf(ENAMETOOLONG);
    std::ranges::copy(path, address.sun_path);
    return textOf(errorOfConnecting(reinterpret_cast<const sockaddr*>(&address), sizeof address));
}

}  // namespace

std::string connectFailure(const std::string& host, int port) {
    if (host.starts_with('/'))
        return socketFailure(host);
    addrinfo hints{};
    hints.ai_socktype = SOCK_STREAM;
    addrinfo* found = nullptr;
    if (const int unknown = getaddrinfo(host.c_str(), std::to_string(port).c_str(), &hints, &found);
        unknown != 0)
        return gai_strerror(unknown);
    const std::unique_ptr<addrinfo, decltype(&freeaddrinfo)> owner{found, &freeaddrinfo};
    int error = 0;
    for (const auto* address = found; address != nullptr; address = address->ai_next)
        if (error = errorOfConnecting(address->ai_addr, address->ai_addrlen); error == 0)
            break;
    return textOf(error);
}

}  // namespace ventras
