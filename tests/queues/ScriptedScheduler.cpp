#include "tests/queues/ScriptedScheduler.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <utility>

namespace ventras {
namespace {

/// Waits until the socket has something to say. @return false when the scheduler is to stop instead.
bool waitFor(int socket, int stop) {
    std::array descriptors{pollfd{socket, POLLIN, 0}, pollfd{stop, POLLIN, 0}};
    poll(descriptors.data(), descriptors.size(), -1);
    return descriptors[1].revents == 0;
}

}  // namespace

ScriptedScheduler::ScriptedScheduler(Answer answer)
    : answer_(std::move(answer)), stop_(eventfd(0, EFD_CLOEXEC)), thread_([this] { serve(); }) {}

ScriptedScheduler::~ScriptedScheduler() {
    eventfd_write(stop_, 1);
    thread_.join();
    close(stop_);
}

std::vector<HttpMessage> ScriptedScheduler::requests() const {
    const std::lock_guard lock(mutex_);
    return requests_;
}

void ScriptedScheduler::serve() {
    while (waitFor(listener_.descriptor(), stop_))
        if (const int socket = accept4(listener_.descriptor(), nullptr, nullptr, SOCK_CLOEXEC); socket >= 0)
            converse(socket);
}

void ScriptedScheduler::converse(int socket) {
    ScriptedConnection connection(socket, [this](const HttpMessage& message) { return reply(message); });
    while (!connection.isOver() && waitFor(connection.socket(), stop_)) {
        connection.onReadable();
        connection.advance();
    }
}

ScriptedReply ScriptedScheduler::reply(const HttpMessage& message) {
    const IppPtr request = decodeIpp(message.body);
    if (!request)
        return {.bytes = httpResponse("400 Bad Request", "text/plain", "no IPP\n")};
    {
        const std::lock_guard lock(mutex_);
        requests_.push_back(message);
    }
    const IppPtr answer{ippNewResponse(request.get())};
    answer_(answer.get());
    return {.bytes = httpResponse("200 OK", "application/ipp", encodeIpp(answer.get()))};
}

void addQueue(ipp_t* answer, const std::string& name, const std::string& uri) {
    ippAddString(answer, IPP_TAG_PRINTER, IPP_TAG_NAME, "printer-name", nullptr, name.c_str());
    ippAddString(answer, IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, uri.c_str());
    ippAddInteger(answer, IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-type", 4);
    ippAddSeparator(answer);
}

}  // namespace ventras
