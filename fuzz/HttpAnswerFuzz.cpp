#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <mutex>
#include <string>
#include <thread>
#include <utility>

#include "fuzz/Require.h"
#include "platform/IppConnection.h"
#include "tests/parts/TemporaryFolder.h"

// Whatever a printer sends when it is asked something over HTTP: the input is its whole side of the
// conversation, on every connection anew, and then it hangs up. An exchange ends in time, and has an answer
// or a reason.

namespace {

using namespace ventras;
using namespace std::chrono_literals;

/// A peer on a socket of the file system that says the same to everybody.
class Speaker {
public:
    explicit Speaker(std::string path)
        : path_(std::move(path)), listener_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::strncpy(address.sun_path, path_.c_str(), sizeof address.sun_path - 1);
        require(bind(listener_, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0);
        require(listen(listener_, 16) == 0);
        std::thread([this] { serve(); }).detach();
    }

    const std::string& path() const { return path_; }

    void says(std::string answer) {
        const std::lock_guard lock(mutex_);
        answer_ = std::move(answer);
    }

private:
    std::string answer() {
        const std::lock_guard lock(mutex_);
        return answer_;
    }

    void serve() {
        for (;;) {
            const int connection = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
            const auto bytes = answer();
            [[maybe_unused]] const auto sent = send(connection, bytes.data(), bytes.size(), MSG_NOSIGNAL);
            shutdown(connection, SHUT_WR);
            std::array<char, 4096> asked{};
            while (recv(connection, asked.data(), asked.size(), 0) > 0) {
            }
            close(connection);
        }
    }

    std::string path_;
    int listener_;
    std::mutex mutex_;
    std::string answer_;
};

IppPtr question() {
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr, "ipp://localhost/");
    return request;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const TemporaryFolder folder;
    static Speaker& peer = *new Speaker(folder / "peer");  // its thread lives as long as the process
    peer.says({reinterpret_cast<const char*>(data), size});
    auto connection = IppConnection::toPrinter(peer.path(), 0, HTTP_ENCRYPTION_NEVER, 200ms);
    require(connection.connected());
    const auto began = std::chrono::steady_clock::now();
    const auto answer = connection.exchange(question(), "/ipp/print");
    require(std::chrono::steady_clock::now() - began < 3s);
    require(answer.succeeded() ? answer.response != nullptr : !answer.reason.empty());
    return 0;
}
