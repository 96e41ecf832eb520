#include "tests/parts/ScriptedConnection.h"

#include <strings.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>

namespace ventras {
namespace {

constexpr std::string_view kEndOfHeaders = "\r\n\r\n";
constexpr std::string_view kEndOfLine = "\r\n";
constexpr char kTlsHandshake = '\x16';

std::size_t toNumber(std::string_view digits, int base) {
    std::size_t number = 0;
    std::from_chars(digits.data(), digits.data() + digits.size(), number, base);
    return number;
}

// The value of a header field, without leading blanks; empty when absent.
std::string_view headerField(std::string_view headers, std::string_view name) {
    for (std::size_t begin = 0; begin < headers.size();) {
        const auto end = std::min(headers.find(kEndOfLine, begin), headers.size());
        const auto line = headers.substr(begin, end - begin);
        if (line.size() > name.size() && line[name.size()] == ':' &&
            strncasecmp(line.data(), name.data(), name.size()) == 0) {
            const auto value = line.find_first_not_of(' ', name.size() + 1);
            return value == std::string_view::npos ? std::string_view{} : line.substr(value);
        }
        begin = end + kEndOfLine.size();
    }
    return {};
}

struct Body {
    std::string content;
    std::size_t length;  // as it stands in the stream
};

std::optional<Body> chunkedBody(std::string_view stream) {
    Body body{};
    for (;;) {
        const auto endOfSize = stream.find(kEndOfLine, body.length);
        if (endOfSize == std::string_view::npos)
            return std::nullopt;
        const auto size = toNumber(stream.substr(body.length, endOfSize - body.length), 16);
        const auto begin = endOfSize + kEndOfLine.size();
        if (stream.size() < begin + size + kEndOfLine.size())
            return std::nullopt;
        body.content.append(stream.substr(begin, size));
        body.length = begin + size + kEndOfLine.size();
        if (size == 0)
            return body;
    }
}

std::optional<Body> bodyOf(std::string_view headers, std::string_view stream) {
    if (headerField(headers, "Transfer-Encoding") == "chunked")
        return chunkedBody(stream);
    const auto length = toNumber(headerField(headers, "Content-Length"), 10);
    if (stream.size() < length)
        return std::nullopt;
    return Body{std::string(stream.substr(0, length)), length};
}

}  // namespace

std::optional<HttpMessage> takeHttpRequest(std::string& bytes) {
    const auto endOfHeaders = bytes.find(kEndOfHeaders);
    if (endOfHeaders == std::string::npos)
        return std::nullopt;
    const auto headers = std::string_view(bytes).substr(0, endOfHeaders + kEndOfLine.size());
    const auto bodyBegin = endOfHeaders + kEndOfHeaders.size();
    auto body = bodyOf(headers, std::string_view(bytes).substr(bodyBegin));
    if (!body)
        return std::nullopt;
    const auto methodEnd = std::min(headers.find(' '), headers.size());
    const auto resourceEnd = std::min(headers.find(' ', methodEnd + 1), headers.size());
    HttpMessage message{std::string(headers.substr(0, methodEnd)),
                        methodEnd == headers.size()
                            ? ""
                            : std::string(headers.substr(methodEnd + 1, resourceEnd - methodEnd - 1)),
                        std::move(body->content)};
    bytes.erase(0, bodyBegin + body->length);
    return message;
}

bool waitsForContinue(std::string_view bytes) {
    const auto end = bytes.find(kEndOfHeaders);
    return end != std::string_view::npos && headerField(bytes.substr(0, end), "Expect").starts_with("100");
}

ScriptedConnection::~ScriptedConnection() {
    close(socket_);
}

void ScriptedConnection::onReadable() {
    std::array<char, 16384> buffer;
    const auto length = recv(socket_, buffer.data(), buffer.size(), MSG_DONTWAIT);
    if (length == 0 || (length < 0 && errno != EAGAIN && errno != EINTR))
        over_ = true;
    if (length <= 0 || silent_)
        return;
    received_.append(buffer.data(), static_cast<std::size_t>(length));
    beginReplyIfComplete();
}

void ScriptedConnection::beginReplyIfComplete() {
    if (reply_)
        return;
    if (!continued_ && waitsForContinue(received_)) {
        continued_ = true;
        send("HTTP/1.1 100 Continue\r\n\r\n");
    }
    auto message = received_.starts_with(kTlsHandshake) ? HttpMessage{} : takeHttpRequest(received_);
    if (!message)
        return;
    continued_ = false;
    reply_ = answerer_(*message);
    sent_ = 0;
    due_ = Clock::now() + reply_->delay;
}

void ScriptedConnection::advance() {
    while (reply_ && !over_ && Clock::now() >= due_) {
        const auto rest = std::string_view(reply_->bytes).substr(sent_);
        const auto step = reply_->bytesPerStep == 0 ? rest : rest.substr(0, reply_->bytesPerStep);
        send(step);
        sent_ += step.size();
        due_ += reply_->stepInterval;
        if (sent_ < reply_->bytes.size())
            continue;
        silent_ = reply_->after == AfterReply::staySilent;
        over_ = over_ || reply_->after == AfterReply::close;
        reply_.reset();
        if (!silent_ && !over_)
            beginReplyIfComplete();
    }
}

// Replies are small: a peer that does not read one is waited for, as long as the socket's send limit says.
void ScriptedConnection::send(std::string_view bytes) {
    while (!bytes.empty()) {
        const auto sent = ::send(socket_, bytes.data(), bytes.size(), MSG_NOSIGNAL);
        if (sent < 0) {
            over_ = true;
            return;
        }
        bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
}

std::optional<ScriptedConnection::Clock::time_point> ScriptedConnection::nextMoment() const {
    return reply_ ? std::optional{due_} : std::nullopt;
}

}  // namespace ventras
