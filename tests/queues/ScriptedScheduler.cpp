#include "tests/queues/ScriptedScheduler.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <list>
#include <utility>
#include <vector>

namespace ventras {
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
    std::list<ScriptedConnection> connections;
    for (;;) {
        std::vector<pollfd> descriptors{{stop_, POLLIN, 0}, {listener_.descriptor(), POLLIN, 0}};
        for (const auto& connection : connections)
            descriptors.push_back({connection.socket(), POLLIN, 0});
        poll(descriptors.data(), descriptors.size(), -1);
        if (descriptors[0].revents != 0)
            return;

        auto descriptor = descriptors.begin() + 2;
        for (auto& connection : connections)
            if ((descriptor++)->revents != 0) {
                connection.onReadable();
                connection.advance();
            }
        connections.remove_if([](const auto& connection) { return connection.isOver(); });
        if (descriptors[1].revents == 0)
            continue;
        if (const int socket = accept4(listener_.descriptor(), nullptr, nullptr, SOCK_CLOEXEC); socket >= 0)
            connections.emplace_back(socket, [this](const HttpMessage& message) { return reply(message); });
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
