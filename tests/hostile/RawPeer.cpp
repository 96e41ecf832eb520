#include "tests/hostile/RawPeer.h"

#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <utility>

namespace ventras {
namespace {

bool say(int socket, const std::string& text) {
    return send(socket, text.data(), text.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(text.size());
}

}  // namespace

RawPeer::RawPeer(RawSpeech speech) : speech_(std::move(speech)), listener_(LoopbackAddress::v4) {
    thread_ = std::jthread([this] { serve(); });
}

RawPeer::~RawPeer() {
    shutdown(listener_.descriptor(), SHUT_RDWR);
    thread_.join();
    for (const int socket : sockets_)
        shutdown(socket, SHUT_RDWR);
    conversations_.clear();
    for (const int socket : sockets_)
        close(socket);
}

std::string RawPeer::uri() const {
    return "ipp://127.0.0.1:" + std::to_string(listener_.port()) + "/ipp/print";
}

void RawPeer::serve() {
    for (;;) {
        const int socket = accept4(listener_.descriptor(), nullptr, nullptr, SOCK_CLOEXEC);
        if (socket < 0)
            return;
        const std::lock_guard lock(mutex_);
        sockets_.push_back(socket);
        conversations_.emplace_back([this, socket] { speak(socket); });
    }
}

void RawPeer::speak(int socket) const {
    bool isHeard = say(socket, speech_.once);
    while (isHeard && !speech_.forever.empty())
        isHeard = say(socket, speech_.forever);
    shutdown(socket, SHUT_WR);
    // A peer that closes with something unread resets the connection, and what it said is lost.
    std::array<char, 4096> heard{};
    while (recv(socket, heard.data(), heard.size(), 0) > 0) {
    }
}

}  // namespace ventras
