#pragma once

#include <cstdint>
#include <vector>

#include "tests/parts/Loopback.h"

namespace ventras {

/// A TCP port on 127.0.0.1 that neither completes nor refuses a connection, like a host that is switched off:
/// its backlog is full. One thread at a time.
class BlackHole {
public:
    BlackHole();
    BlackHole(const BlackHole&) = delete;
    BlackHole& operator=(const BlackHole&) = delete;
    ~BlackHole();

    std::uint16_t port() const { return socket_.port(); }

private:
    ListeningSocket socket_;
    std::vector<int> fillers_;
};

}  // namespace ventras
