#pragma once

#include <chrono>
#include <optional>
#include <string>

#include "platform/Deadline.h"
#include "platform/Handles.h"

namespace ventras {

/// What came of one IPP request.
struct IppAnswer {
    IppPtr response;      ///< empty when no IPP answer arrived
    ipp_status_t status;  ///< libcups' verdict on the whole exchange (RFC 8011 appendix B)
    std::string reason;   ///< one line for people: why `status` is no success

    /// A successful-ok status; only this says that the request was carried out, a response alone does not.
    bool succeeded() const { return status <= IPP_STATUS_OK_EVENTS_COMPLETE; }
};

/// One HTTP connection for IPP requests (RFC 8010), bounded in time.
///
/// Nobody is ever asked for a password: a peer that demands one is a failed exchange. Use it on one thread.
class IppConnection {
public:
    /// Longest time for reaching a printer, TLS handshake included.
    static constexpr std::chrono::milliseconds kConnectLimit = std::chrono::seconds(10);
    /// Longest time for one whole exchange with a printer, and with the scheduler.
    static constexpr std::chrono::milliseconds kPrinterLimit = std::chrono::seconds(30);
    static constexpr std::chrono::milliseconds kSchedulerLimit = std::chrono::seconds(120);
    static constexpr std::chrono::milliseconds kImpatientLimit = std::chrono::seconds(5);

    /// Connects to any address of `host`, an IPv6 literal without brackets included.
    /// @param port TCP port; 443 always means TLS
    /// @param limit for each exchange later on
    static IppConnection toPrinter(const std::string& host, int port, http_encryption_t encryption,
                                   std::chrono::milliseconds limit = kPrinterLimit);

    /// Connects to the scheduler of the user's libcups configuration. A scheduler that has just kept somebody
    /// in this process waiting for a whole limit has kImpatientLimit for an answer, until it gives one again.
    static IppConnection toScheduler(std::chrono::milliseconds limit = kSchedulerLimit);

    /// Whether the peer was reached.
    bool connected() const { return http_ != nullptr; }

    /// Why the peer was not reached: the text of the system's error, or that it took too long.
    const std::string& failure() const { return failure_; }

    /// Sends one request and waits for its answer.
    /// @param request consumed
    /// @param resource path, beginning with "/"
    /// @param document descriptor of a file to send after the request; -1 = none
    /// @param received descriptor for the document that comes back; -1 = none
    /// @return without a connection: no response, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE.
    IppAnswer exchange(IppPtr request, const std::string& resource, int document = -1, int received = -1);

private:
    enum class Peer { Printer, Scheduler };

    IppConnection(Peer peer, const std::string& host, int port, http_encryption_t encryption,
                  std::chrono::milliseconds limit);
    IppAnswer exchangeBy(Deadline deadline, IppPtr request, const std::string& resource, int document,
                         int received);

    Peer peer_;
    HttpPtr http_;
    std::string failure_;
    std::chrono::milliseconds limit_;
};

}  // namespace ventras
