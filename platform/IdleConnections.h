#pragma once

#include <cups/cups.h>

#include <chrono>
#include <list>
#include <memory>
#include <mutex>
#include <string>

#include "platform/Alarm.h"
#include "platform/Handles.h"

namespace ventras {

/// Whom a connection leads to.
struct Peer {
    std::string host;
    int port = 0;
    http_encryption_t encryption = HTTP_ENCRYPTION_IF_REQUESTED;

    bool operator==(const Peer&) const = default;
};

/// Connections whose exchange is over, kept for the next question to the same peer: connecting takes both
/// sides longer than most questions do. A peer that serves one connection at a time must not be held up by
/// one that nobody uses, so each is hung up after a short while. Any thread may call.
class IdleConnections {
public:
    /// Longest time without use; less than servers allow.
    static constexpr std::chrono::milliseconds kLongestRest = std::chrono::seconds(2);
    /// Most connections to one peer: a scheduler has few places.
    static constexpr std::size_t kMostForOne = 4;
    /// Most connections at all: a process has few descriptors.
    static constexpr std::size_t kMost = 128;

    /// The process's own.
    static IdleConnections& shared();

    /// @return empty when there is none that is still open.
    HttpPtr take(const Peer& peer);

    /// @param connection between two exchanges
    void keep(Peer peer, HttpPtr connection);

private:
    struct Resting {
        Resting(Peer whom, HttpPtr what);

        Peer peer;
        HttpPtr connection;
        Deadline end;
        Alarm hangsUp;  // last: it uses the connection
    };

    void dropExpired();

    std::mutex mutex_;
    std::list<Resting> resting_;
};

/// Whether the peer has hung up on a connection between two exchanges, or says what nobody asked.
bool hasEnded(http_t* connection);

}  // namespace ventras
