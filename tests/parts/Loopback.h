#pragma once

#include <cstdint>
#include <string>

namespace ventras {

/// The loopback interface's two addresses.
enum class LoopbackAddress { v4, v6 };

/// A listening TCP socket on loopback, closed with its owner. Values move; one thread at a time.
class ListeningSocket {
public:
    /// @param port 0 = any free one
    /// @param backlog connections that the kernel completes before accept()
    /// @throw std::system_error when the port is taken.
    explicit ListeningSocket(LoopbackAddress address, std::uint16_t port = 0, int backlog = 128);
    ListeningSocket(ListeningSocket&& other) noexcept;
    ListeningSocket& operator=(ListeningSocket&& other) noexcept;
    ~ListeningSocket();

    int descriptor() const { return descriptor_; }
    std::uint16_t port() const;

private:
    int descriptor_;
};

/// A TCP port that nobody uses on either loopback address, outside the range that the kernel gives to
/// outgoing connections. Another process may take it before the caller does: be ready to ask again.
std::uint16_t freePort();

/// Connects to a loopback port.
/// @return the socket, for the caller to close; -1 when refused.
int connectToLoopback(LoopbackAddress address, std::uint16_t port);

}  // namespace ventras
