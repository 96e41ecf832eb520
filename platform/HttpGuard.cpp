#include "platform/HttpGuard.h"

#include <sys/socket.h>

#include <chrono>

namespace ventras {
namespace {

constexpr auto kRepeat = std::chrono::milliseconds(50);
constexpr double kLongestWaitInSeconds = 1.0;

// libcups asks after each silent wait whether to wait on.
int waitOn(http_t*, void* deadline) {
    return static_cast<const Deadline*>(deadline)->passed() ? 0 : 1;
}

}  // namespace

HttpGuard::HttpGuard(http_t* connection, Deadline deadline) : connection_(connection), deadline_(deadline) {
    httpSetTimeout(connection_, kLongestWaitInSeconds, waitOn, &deadline_);
    watcher_ = std::jthread([this](const std::stop_token& stop) { watch(stop); });
}

HttpGuard::~HttpGuard() {
    watcher_.request_stop();
    watcher_.join();
    httpSetTimeout(connection_, 0.0, nullptr,
                   nullptr);  // the deadline that waitOn() reads goes with the guard
}

void HttpGuard::watch(const std::stop_token& stop) {
    std::unique_lock lock(mutex_);
    const auto never = [] { return false; };
    stopped_.wait_until(lock, stop, deadline_.moment(), never);
    while (!stop.stop_requested()) {
        if (const int socket = httpGetFd(connection_); socket >= 0)
            shutdown(socket, SHUT_RDWR);
        stopped_.wait_for(lock, stop, kRepeat, never);
    }
}

}  // namespace ventras
