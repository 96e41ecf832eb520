#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "tests/parts/ScriptedReply.h"

namespace ventras {

/// One HTTP request as it came in.
struct HttpMessage {
    std::string method;
    std::string resource;
    std::string body;  ///< chunks joined
};

/// Takes the first complete HTTP request off the front of `bytes`.
/// @return absent while it is incomplete.
std::optional<HttpMessage> takeHttpRequest(std::string& bytes);

/// Whether `bytes` begin with a request that waits for "100 Continue" before it sends its body.
bool waitsForContinue(std::string_view bytes);

/// The server's side of one connection: collects requests, sends replies at the pace that they ask for.
/// Made for a poll loop: nothing here blocks. One thread at a time.
class ScriptedConnection {
public:
    using Clock = std::chrono::steady_clock;
    using Answerer = std::function<ScriptedReply(const HttpMessage&)>;

    /// @param socket taken over
    ScriptedConnection(int socket, Answerer answerer) : socket_(socket), answerer_(std::move(answerer)) {}
    ScriptedConnection(const ScriptedConnection&) = delete;
    ScriptedConnection& operator=(const ScriptedConnection&) = delete;
    ~ScriptedConnection();

    int socket() const { return socket_; }
    bool isOver() const { return over_; }

    /// Reads what has arrived.
    void onReadable();

    /// Sends what is due now.
    void advance();

    /// When advance() has something to do again; absent = not before more bytes arrive.
    std::optional<Clock::time_point> nextMoment() const;

private:
    void beginReplyIfComplete();
    void send(std::string_view bytes);

    int socket_;
    Answerer answerer_;
    std::string received_;
    std::optional<ScriptedReply> reply_;
    std::size_t sent_ = 0;
    Clock::time_point due_;
    bool continued_ = false;
    bool silent_ = false;
    bool over_ = false;
};

}  // namespace ventras
