#pragma once

#include <cstdint>
#include <list>
#include <mutex>
#include <string>
#include <thread>

#include "tests/parts/Loopback.h"

namespace ventras {

/// What a RawPeer says to everybody who connects, before it hangs up.
struct RawSpeech {
    std::string once;
    std::string forever =
        {};  ///< said again and again behind it, until the other side hangs up; empty = nothing
};

/// A port on 127.0.0.1 that speaks first and listens to nobody: for bytes that are no HTTP, or never end. Any
/// thread may ask for its address.
class RawPeer {
public:
    explicit RawPeer(RawSpeech speech);
    RawPeer(const RawPeer&) = delete;
    RawPeer& operator=(const RawPeer&) = delete;
    ~RawPeer();

    std::string uri() const;

private:
    void serve();
    void speak(int socket) const;

    RawSpeech speech_;
    ListeningSocket listener_;
    std::mutex mutex_;
    std::list<int> sockets_;
    std::list<std::jthread> conversations_;
    std::jthread thread_;
};

}  // namespace ventras
