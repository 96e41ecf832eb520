#include "tests/machine/HttpOverUsb.h"

#include <netinet/in.h>
#include <sys/socket.h>

#include <array>

namespace ventras {
namespace {

FileDescriptor connectionTo(std::uint16_t port) {
    FileDescriptor connection(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (connect(connection.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
        return {};
    return connection;
}

bool beginsRequest(std::string_view data) {
    return data.starts_with("GET ") || data.starts_with("POST ");
}

std::string received(int connection) {
    std::string all;
    std::array<char, 16384> buffer{};
    ssize_t length = 0;
    while ((length = recv(connection, buffer.data(), buffer.size(), MSG_DONTWAIT)) > 0)
        all.append(buffer.data(), static_cast<std::size_t>(length));
    return all;
}

}  // namespace

// Each request has a connection of its own: ippeveprinter hangs up on whoever says nothing for long, and
// takes no request after one that it has refused.
std::string HttpOverUsb::operator()(std::uint8_t interface, std::string_view data) {
    auto& [connection, isAnswered] = exchanges_[interface];
    if (isAnswered && beginsRequest(data)) {
        connection = connectionTo(port_);
        isAnswered = false;
    }
    send(connection.get(), data.data(), data.size(), MSG_NOSIGNAL);
    auto answer = received(connection.get());
    isAnswered = isAnswered || !answer.empty();
    return answer;
}

}  // namespace ventras
