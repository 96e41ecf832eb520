#include "platform/HttpGuard.h"

#include <sys/socket.h>

namespace ventras {
namespace {

constexpr double kLongestWaitInSeconds = 1.0;

// libcups asks after each silent wait whether to wait on; and, without waiting at all, while it has no
// connection, which it loses when a peer hangs up on it as often as it connects again by itself.
int waitOn(http_t* connection, void* deadline) {
    return httpGetFd(connection) >= 0 && !static_cast<const Deadline*>(deadline)->passed() ? 1 : 0;
}

Alarm::Afterwards shutDown(http_t* connection) {
    if (const int socket = httpGetFd(connection); socket >= 0)
        shutdown(socket, SHUT_RDWR);
    return Alarm::Afterwards::RingsAgain;
}

}  // namespace

HttpGuard::HttpGuard(http_t* connection, Deadline deadline)
    : connection_(connection),
      deadline_(deadline),
      alarm_(deadline, [connection] { return shutDown(connection); }) {
    httpSetTimeout(connection_, kLongestWaitInSeconds, waitOn, &deadline_);
}

HttpGuard::~HttpGuard() {
    // The deadline that waitOn() reads goes with the guard.
    httpSetTimeout(connection_, 0.0, nullptr, nullptr);
}

}  // namespace ventras
