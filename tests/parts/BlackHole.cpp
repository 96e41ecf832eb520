#include "tests/parts/BlackHole.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

namespace ventras {
namespace {

constexpr int kMostFillers = 8;
constexpr int kSettleMilliseconds = 100;

int beginConnecting(std::uint16_t port) {
    const int filler = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    sockaddr_in target{};
    target.sin_family = AF_INET;
    target.sin_port = htons(port);
    target.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    connect(filler, reinterpret_cast<const sockaddr*>(&target), sizeof target);
    return filler;
}

bool isConnected(int filler) {
    pollfd descriptor{filler, POLLOUT, 0};
    return poll(&descriptor, 1, kSettleMilliseconds) == 1;
}

}  // namespace

// The kernel takes one connection more than the backlog of 0; the first one that stays half open shows that
// the next ones will too.
BlackHole::BlackHole() : socket_(LoopbackAddress::v4, 0, 0) {
    for (int i = 0; i < kMostFillers; ++i) {
        fillers_.push_back(beginConnecting(port()));
        if (!isConnected(fillers_.back()))
            return;
    }
}

BlackHole::~BlackHole() {
    for (const int filler : fillers_)
        close(filler);
}

}  // namespace ventras
