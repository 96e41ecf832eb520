#include "platform/IdleConnections.h"

#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <utility>

namespace ventras {

IdleConnections::Resting::Resting(Peer whom, HttpPtr what)
    : peer(std::move(whom)),
      connection(std::move(what)),
      end(Deadline::after(kLongestRest)),
      hangsUp(end, [socket = httpGetFd(connection.get())] {
          shutdown(socket, SHUT_RDWR);
          return Alarm::Afterwards::Silent;
      }) {}

// Never freed: others may still be in the middle of an exchange while the process ends.
IdleConnections& IdleConnections::shared() {
    static auto& shared = *new IdleConnections;
    return shared;
}

HttpPtr IdleConnections::take(const Peer& peer) {
    const std::lock_guard lock(mutex_);
    dropExpired();
    for (;;) {
        const auto found = std::ranges::find(resting_, peer, &Resting::peer);
        if (found == resting_.end())
            return nullptr;
        auto connection = std::move(found->connection);
        resting_.erase(found);
        if (!hasEnded(connection.get()))
            return connection;
    }
}

void IdleConnections::keep(Peer peer, HttpPtr connection) {
    const std::lock_guard lock(mutex_);
    dropExpired();
    if (static_cast<std::size_t>(std::ranges::count(resting_, peer, &Resting::peer)) >= kMostForOne)
        return;
    if (resting_.size() == kMost)
        resting_.pop_back();  // the one that has rested longest
    resting_.emplace_front(std::move(peer), std::move(connection));
}

void IdleConnections::dropExpired() {
    resting_.remove_if([](const Resting& resting) { return resting.end.passed(); });
}

bool hasEnded(http_t* connection) {
    char byte = 0;
    const auto length = recv(httpGetFd(connection), &byte, 1, MSG_PEEK | MSG_DONTWAIT);
    if (length > 0)
        return httpIsEncrypted(connection) == 0;  // TLS has things to say between exchanges, too
    return length == 0 || (errno != EAGAIN && errno != EWOULDBLOCK);
}

}  // namespace ventras
