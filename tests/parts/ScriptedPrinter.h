#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <list>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "tests/parts/Loopback.h"
#include "tests/parts/ScriptedConnection.h"
#include "tests/parts/ScriptedReply.h"

namespace ventras {

/// Changes a proper answer before it is sent.
using AttributeEdit = std::function<void(ipp_t*)>;

/// An attribute that replaces those of its name, sent exactly as it stands here.
struct RawAttribute {
    ipp_tag_t tag;
    std::string name;
    std::string value;
};

/// What a scripted printer is to say, and how.
struct ScriptedPrinterOptions {
    std::string name = "Scripted";
    std::string makeAndModel = "Acme Scripted";
    std::string location = "Lab 3";

    AttributeEdit edit = {};  ///< of the answer to Get-Printer-Attributes; on the printer's thread
    std::vector<RawAttribute> rawAttributes = {};
    ipp_status_t status = IPP_STATUS_OK;  ///< of the answer to Get-Printer-Attributes
    std::string statusMessage = {};       ///< empty = none

    std::string document = {};  ///< comes after each answer

    /// Resources that exist, each with a further edit. Empty: every resource is the printer.
    std::map<std::string, AttributeEdit> services = {};

    std::chrono::milliseconds delay{};  ///< before each answer

    Fault fault = Fault::none;
    std::size_t healthyRequests = 0;  ///< so many are answered properly before the fault
    std::chrono::milliseconds dripInterval = std::chrono::milliseconds(500);

    bool listensOnIPv4 = true;
    bool listensOnIPv6 = false;
};

/// A request that a scripted printer was sent.
struct ScriptedRequest {
    ipp_op_t operation = IPP_OP_CUPS_INVALID;
    std::string resource;
    std::string printerUri;
    std::string userName;
    std::vector<std::string> requestedAttributes;
};

/// An IPP printer of our own on loopback that answers Get-Printer-Attributes in whatever way a test needs,
/// and prints nothing. It costs a thread and a socket or two, so hundreds fit in one process.
///
/// Any thread may ask it questions.
class ScriptedPrinter {
public:
    explicit ScriptedPrinter(ScriptedPrinterOptions options = {});
    ScriptedPrinter(const ScriptedPrinter&) = delete;
    ScriptedPrinter& operator=(const ScriptedPrinter&) = delete;
    ~ScriptedPrinter();

    std::uint16_t port() const { return port_; }

    /// "SCHEME://HOST:PORT/ipp/print"; the host defaults to the address that it listens on.
    std::string uri(std::string_view scheme = "ipp", std::string_view host = {}) const;

    /// The IPP requests so far, in order.
    std::vector<ScriptedRequest> requests() const;

    /// The connections so far.
    std::size_t connectionCount() const { return connectionCount_; }

private:
    void openSockets();
    void serve();
    void accept(int listener);
    ScriptedReply answer(const HttpMessage& message);
    IppPtr properAnswer(ipp_t* request, const ScriptedRequest& asked) const;

    ScriptedPrinterOptions options_;
    std::vector<ListeningSocket> listeners_;
    std::uint16_t port_ = 0;
    int stop_;
    std::list<ScriptedConnection> connections_;
    std::atomic<std::size_t> connectionCount_ = 0;
    mutable std::mutex mutex_;
    std::vector<ScriptedRequest> requests_;
    std::jthread thread_;
};

/// What a good driverless printer tells about itself: A4 and Letter, duplex, colour, PDF and URF.
void addDriverlessAttributes(ipp_t* answer, const ScriptedPrinterOptions& options);

/// Takes an attribute out of an answer.
void removeAttribute(ipp_t* answer, const char* name);

/// Replaces an attribute of an answer by one text, name, keyword or URI.
void setAttribute(ipp_t* answer, ipp_tag_t tag, const char* name, const std::string& value);

}  // namespace ventras
