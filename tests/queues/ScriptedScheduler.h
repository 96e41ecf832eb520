#pragma once

#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/Handles.h"
#include "tests/parts/Loopback.h"
#include "tests/parts/ScriptedConnection.h"

namespace ventras {

/// A print scheduler of our own on loopback that says whatever a test needs, where the real one would never
/// say it. Any thread may ask for what it was sent.
class ScriptedScheduler {
public:
    /// Fills in the answer to each request, on the scheduler's thread.
    using Answer = std::function<void(ipp_t* answer)>;

    explicit ScriptedScheduler(Answer answer);
    ScriptedScheduler(const ScriptedScheduler&) = delete;
    ScriptedScheduler& operator=(const ScriptedScheduler&) = delete;
    ~ScriptedScheduler();

    /// The address as CUPS_SERVER wants it.
    std::string address() const { return "127.0.0.1:" + std::to_string(listener_.port()); }

    /// The IPP requests so far: their HTTP resource, and their bytes.
    std::vector<HttpMessage> requests() const;

private:
    void serve();
    ScriptedReply reply(const HttpMessage& message);

    Answer answer_;
    ListeningSocket listener_{LoopbackAddress::v4};
    int stop_;
    mutable std::mutex mutex_;
    std::vector<HttpMessage> requests_;
    std::jthread thread_;
};

/// Adds a queue to an answer, as the real scheduler describes one.
void addQueue(ipp_t* answer, const std::string& name, const std::string& uri);

}  // namespace ventras
