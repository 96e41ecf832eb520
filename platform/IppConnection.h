#pragma once

#include <chrono>
#include <optional>
#include <string>

#include "platform/Deadline.h"
#include "platform/Handles.h"
#include "platform/IdleConnections.h"
#include "platform/IppAnswer.h"

namespace ventras {

/// One HTTP connection for IPP requests (RFC 8010), bounded in time.
///
/// The TCP connection behind it may be one that an earlier object left, and is left to later ones: a
/// scheduler is asked many things, and a printer two. A peer that has hung up meanwhile is connected to
/// again. Nobody is ever asked for a password: a peer that demands one is a failed exchange. Use it on one
/// thread.
class IppConnection {
public:
    /// Longest time for reaching a peer, the lookup of its name and the TLS handshake included.
    static constexpr std::chrono::milliseconds kConnectLimit = std::chrono::seconds(10);
    /// Longest time for one whole exchange with a printer, and with the scheduler.
    static constexpr std::chrono::milliseconds kPrinterLimit = std::chrono::seconds(30);
    static constexpr std::chrono::milliseconds kSchedulerLimit = std::chrono::seconds(120);
    /// The same with a scheduler that has just kept somebody in this process waiting for a whole limit, until
    /// it gives an answer again.
    static constexpr std::chrono::milliseconds kImpatientLimit = std::chrono::seconds(5);

    /// Connects to any address of `host`, an IPv6 literal without brackets included.
    /// @param port TCP port; 443 always means TLS
    /// @param limit for each exchange later on
    static IppConnection toPrinter(const std::string& host, int port, http_encryption_t encryption,
                                   std::chrono::milliseconds limit = kPrinterLimit);

    /// Connects to the scheduler of the user's libcups configuration.
    /// @param limit for each exchange later on, as long as the scheduler answers; absent = kSchedulerLimit
    static IppConnection toScheduler(std::optional<std::chrono::milliseconds> limit = std::nullopt);

    /// Replaces kSchedulerLimit and kImpatientLimit in this process. Any thread may call.
    static void setSchedulerLimits(std::chrono::milliseconds limit, std::chrono::milliseconds impatientLimit);

    IppConnection(IppConnection&&) = default;
    IppConnection& operator=(IppConnection&&) = delete;
    ~IppConnection();

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
    enum class Role { Printer, Scheduler };

    IppConnection(Role role, Peer peer, std::chrono::milliseconds limit);
    void connect();
    bool reconnect(Deadline deadline);
    IppAnswer exchangeBy(Deadline deadline, ipp_t* request, const std::string& resource, int document,
                         int received);
    bool mayBeKept() const;

    Role role_;
    Peer peer_;
    HttpPtr http_;
    bool isSecondHand_ = false;  ///< another object used the connection before
    bool isUsed_ = false;        ///< somebody did
    bool isSound_ = false;       ///< the last exchange brought an answer
    std::string failure_;
    std::chrono::milliseconds limit_;
};

}  // namespace ventras
