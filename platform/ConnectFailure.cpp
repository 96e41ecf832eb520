#include "platform/ConnectFailure.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
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

int errorOfConnecting(const http_addr_t& address) {
    const int descriptor = socket(address.addr.sa_family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (descriptor < 0)
        return errno;
    const auto length = static_cast<socklen_t>(httpAddrLength(&address));
    int error = connect(descriptor, &address.addr, length) == 0 ? 0 : errno;
    if (error == EINPROGRESS)
        error = errorOfPending(descriptor);
    close(descriptor);
    return error;
}

}  // namespace

std::string connectFailure(const http_addrlist_t* addresses) {
    int error = EDESTADDRREQ;
    for (const auto* address = addresses; address != nullptr; address = address->next)
        if (error = errorOfConnecting(address->addr); error == 0)
            break;
    return error == 0 ? "it does not speak TLS" : std::generic_category().message(error);
}

}  // namespace ventras
