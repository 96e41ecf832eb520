#pragma once

#include <cstdint>
#include <list>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/Handles.h"
#include "tests/parts/Loopback.h"

namespace ventras {

/// A document that a printer was sent.
struct PrintedDocument {
    std::string resource;     ///< where it arrived
    std::string destination;  ///< the telephone number, as "tel:" URI, of a fax
    std::string content;
};

/// Whether a printer's fax service answers.
enum class FaxService { Works, Hangs };

/// An IPP printer with a print and a fax service on one port of loopback, as the daemon for IPP over USB puts
/// it there, that keeps what either is sent. Any thread may ask it questions.
class FaxPrinter {
public:
    static constexpr const char* kPrintResource = "/ipp/print";
    static constexpr const char* kFaxResource = "/ipp/faxout";

    explicit FaxPrinter(FaxService fax = FaxService::Works);
    FaxPrinter(const FaxPrinter&) = delete;
    FaxPrinter& operator=(const FaxPrinter&) = delete;
    ~FaxPrinter();

    std::uint16_t port() const { return socket_.port(); }

    /// The documents so far, in the order in which they were complete.
    std::vector<PrintedDocument> documents() const;

    /// Waits until so many documents have arrived.
    bool receivedWithin(std::chrono::milliseconds limit, std::size_t count) const;

private:
    void accept();
    void serve(http_t* http);
    void waitForEnd() const;
    bool serveRequest(http_t* http);
    IppPtr answer(ipp_t* request, const std::string& resource, std::string content);
    void addJob(ipp_t* answer, int job) const;

    FaxService fax_;
    ListeningSocket socket_{LoopbackAddress::v4};
    int stop_;
    mutable std::mutex mutex_;
    int lastJob_ = 0;
    std::map<int, std::string> destinations_;
    std::vector<PrintedDocument> documents_;
    std::list<std::jthread> connections_;
    std::jthread listener_;
};

}  // namespace ventras
