#include "tests/parts/ScriptedPrinter.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <optional>
#include <system_error>

namespace ventras {
namespace {

constexpr int kPortAttempts = 20;
constexpr timeval kSendLimit{5, 0};
constexpr std::array kEverything{"all", "printer-description", "job-template"};

std::string textOf(ipp_t* message, const char* name) {
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_ZERO);
    const char* text = attribute != nullptr ? ippGetString(attribute, 0, nullptr) : nullptr;
    return text != nullptr ? text : "";
}

ScriptedRequest describe(ipp_t* message, const std::string& resource) {
    ScriptedRequest request{ippGetOperation(message),
                            resource,
                            textOf(message, "printer-uri"),
                            textOf(message, "requesting-user-name"),
                            {}};
    auto* requested = ippFindAttribute(message, "requested-attributes", IPP_TAG_KEYWORD);
    for (int i = 0; requested != nullptr && i < ippGetCount(requested); ++i)
        request.requestedAttributes.emplace_back(ippGetString(requested, i, nullptr));
    return request;
}

bool wants(const std::vector<std::string>& requested, std::string_view name) {
    const auto means = [name](const std::string& word) {
        return word == name || std::ranges::find(kEverything, word) != kEverything.end();
    };
    return requested.empty() || std::ranges::any_of(requested, means);
}

void keepOnlyRequested(ipp_t* answer, const std::vector<std::string>& requested) {
    std::vector<std::string> unwanted;
    for (auto* attribute = ippFirstAttribute(answer); attribute != nullptr;
         attribute = ippNextAttribute(answer))
        if (const char* name = ippGetName(attribute);
            name != nullptr && ippGetGroupTag(attribute) == IPP_TAG_PRINTER && !wants(requested, name))
            unwanted.emplace_back(name);
    for (const auto& name : unwanted)
        removeAttribute(answer, name.c_str());
}

std::string rawBytes(const std::vector<RawAttribute>& attributes) {
    std::string bytes;
    for (const auto& [tag, name, value] : attributes)
        bytes += rawAttribute(tag, name, value);
    return bytes;
}

}  // namespace

ScriptedPrinter::ScriptedPrinter(ScriptedPrinterOptions options)
    : options_(std::move(options)), stop_(eventfd(0, EFD_CLOEXEC)) {
    openSockets();
    thread_ = std::jthread([this] { serve(); });
}

ScriptedPrinter::~ScriptedPrinter() {
    eventfd_write(stop_, 1);
    thread_.join();
    close(stop_);
}

void ScriptedPrinter::openSockets() {
    for (int attempt = 1;; ++attempt) {
        port_ = freePort();
        try {
            if (options_.listensOnIPv4)
                listeners_.emplace_back(LoopbackAddress::v4, port_);
            if (options_.listensOnIPv6)
                listeners_.emplace_back(LoopbackAddress::v6, port_);
            return;
        } catch (const std::system_error&) {
            listeners_.clear();
            if (attempt == kPortAttempts)
                throw;
        }
    }
}

std::string ScriptedPrinter::uri(std::string_view scheme, std::string_view host) const {
    if (host.empty())
        host = options_.listensOnIPv4 ? "127.0.0.1" : "[::1]";
    std::string uri(scheme);
    return uri.append("://").append(host).append(":").append(std::to_string(port_)).append("/ipp/print");
}

std::vector<ScriptedRequest> ScriptedPrinter::requests() const {
    const std::lock_guard lock(mutex_);
    return requests_;
}

void ScriptedPrinter::serve() {
    for (;;) {
        std::vector<pollfd> descriptors{{stop_, POLLIN, 0}};
        for (const auto& listener : listeners_)
            descriptors.push_back({listener.descriptor(), POLLIN, 0});
        std::optional<ScriptedConnection::Clock::time_point> next;
        for (const auto& connection : connections_) {
            descriptors.push_back({connection.socket(), POLLIN, 0});
            if (const auto moment = connection.nextMoment(); moment && (!next || *moment < *next))
                next = moment;
        }
        int timeout = -1;
        if (next)
            timeout = static_cast<int>(std::max<std::int64_t>(
                0, std::chrono::ceil<std::chrono::milliseconds>(*next - ScriptedConnection::Clock::now())
                       .count()));
        poll(descriptors.data(), descriptors.size(), timeout);

        if (descriptors.front().revents != 0)
            return;
        auto descriptor = descriptors.begin() + 1 + static_cast<std::ptrdiff_t>(listeners_.size());
        for (auto& connection : connections_) {
            if ((descriptor++)->revents != 0)
                connection.onReadable();
            connection.advance();
        }
        connections_.remove_if([](const auto& connection) { return connection.isOver(); });
        for (std::size_t i = 0; i < listeners_.size(); ++i)
            if (descriptors[i + 1].revents != 0)
                accept(descriptors[i + 1].fd);
    }
}

void ScriptedPrinter::accept(int listener) {
    const int socket = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    if (socket < 0)
        return;
    ++connectionCount_;
    setsockopt(socket, SOL_SOCKET, SO_SNDTIMEO, &kSendLimit, sizeof kSendLimit);
    if (options_.fault == Fault::closeAtOnce && options_.healthyRequests == 0) {
        close(socket);
        return;
    }
    connections_.emplace_back(socket, [this](const HttpMessage& message) { return answer(message); });
}

ScriptedReply ScriptedPrinter::answer(const HttpMessage& message) {
    if (message.method.empty())  // TLS, which it does not speak
        return {.bytes = {},
                .after = options_.fault == Fault::silent ? AfterReply::staySilent : AfterReply::close};
    const IppPtr request = decodeIpp(message.body);
    if (!request)
        return {.bytes = httpResponse("200 OK", "text/plain", "a printer\n")};

    const auto asked = describe(request.get(), message.resource);
    std::size_t count = 0;
    {
        const std::lock_guard lock(mutex_);
        requests_.push_back(asked);
        count = requests_.size();
    }
    const Fault fault = count > options_.healthyRequests ? options_.fault : Fault::none;
    auto reply = faultyReply(fault, properAnswer(request.get(), asked),
                             {rawBytes(options_.rawAttributes), options_.document, options_.dripInterval});
    reply.delay = options_.delay;
    return reply;
}

IppPtr ScriptedPrinter::properAnswer(ipp_t* request, const ScriptedRequest& asked) const {
    IppPtr answer{ippNewResponse(request)};
    const auto service = options_.services.find(asked.resource);
    if (!options_.services.empty() && service == options_.services.end()) {
        ippSetStatusCode(answer.get(), IPP_STATUS_ERROR_NOT_FOUND);
        return answer;
    }
    if (asked.operation != IPP_OP_GET_PRINTER_ATTRIBUTES) {
        ippSetStatusCode(answer.get(), IPP_STATUS_ERROR_OPERATION_NOT_SUPPORTED);
        return answer;
    }
    ippSetStatusCode(answer.get(), options_.status);
    if (!options_.statusMessage.empty())
        ippAddString(answer.get(), IPP_TAG_OPERATION, IPP_TAG_TEXT, "status-message", nullptr,
                     options_.statusMessage.c_str());
    addDriverlessAttributes(answer.get(), options_);
    if (options_.edit)
        options_.edit(answer.get());
    if (service != options_.services.end() && service->second)
        service->second(answer.get());
    keepOnlyRequested(answer.get(), asked.requestedAttributes);
    for (const auto& raw : options_.rawAttributes)
        removeAttribute(answer.get(), raw.name.c_str());
    return answer;
}

}  // namespace ventras
