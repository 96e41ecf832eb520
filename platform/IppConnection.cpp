#include "platform/IppConnection.h"

#include <strings.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <utility>

#include "platform/ConnectFailure.h"
#include "platform/HostAddresses.h"
#include "platform/HttpGuard.h"
#include "platform/IppExchange.h"

namespace ventras {
namespace {

// The agent asks the scheduler several things, one after another and by many threads. One that hangs would
// hold it for as many limits.
std::atomic<bool> isSchedulerSilent = false;
std::atomic<std::chrono::milliseconds> schedulerLimit = IppConnection::kSchedulerLimit;
std::atomic<std::chrono::milliseconds> impatientLimit = IppConnection::kImpatientLimit;

std::chrono::milliseconds limitFor(std::optional<std::chrono::milliseconds> wanted) {
    const auto limit = wanted.value_or(schedulerLimit.load());
    return isSchedulerSilent ? std::min(limit, impatientLimit.load()) : limit;
}

std::string seconds(std::chrono::milliseconds time) {
    return std::to_string(std::chrono::ceil<std::chrono::seconds>(time).count()) + " s";
}

// Requests that change nothing: asked twice, they do no harm.
constexpr std::array kQuestions{IPP_OP_GET_PRINTER_ATTRIBUTES, IPP_OP_CUPS_GET_DEFAULT,
                                IPP_OP_CUPS_GET_PRINTERS, IPP_OP_CUPS_GET_PPDS, IPP_OP_CUPS_GET_PPD};

bool isQuestion(ipp_t* request) {
    return std::ranges::find(kQuestions, ippGetOperation(request)) != kQuestions.end();
}

}  // namespace

IppConnection IppConnection::toPrinter(const std::string& host, int port, http_encryption_t encryption,
                                       std::chrono::milliseconds limit) {
    return IppConnection{Role::Printer, {host, port, encryption}, limit};
}

IppConnection IppConnection::toScheduler(std::optional<std::chrono::milliseconds> limit) {
    return IppConnection{Role::Scheduler, {cupsServer(), ippPort(), cupsEncryption()}, limitFor(limit)};
}

void IppConnection::setSchedulerLimits(std::chrono::milliseconds limit, std::chrono::milliseconds impatient) {
    schedulerLimit = limit;
    impatientLimit = impatient;
}

IppConnection::IppConnection(Role role, Peer peer, std::chrono::milliseconds limit)
    : role_(role),
      peer_(std::move(peer)),
      http_(IdleConnections::shared().take(peer_)),
      isSecondHand_(http_ != nullptr),
      isUsed_(isSecondHand_),
      limit_(limit) {
    if (!http_)
        connect();
}

IppConnection::~IppConnection() {
    if (mayBeKept())
        IdleConnections::shared().keep(std::move(peer_), std::move(http_));
}

// A printer is asked twice and then let go: some serve one connection at a time, and the scheduler wants it
// next.
bool IppConnection::mayBeKept() const {
    return http_ && isSound_ && (role_ == Role::Scheduler || !isSecondHand_) &&
           httpGetState(http_.get()) == HTTP_STATE_WAITING &&
           httpGetVersion(http_.get()) >= HTTP_VERSION_1_1 &&
           strcasecmp(httpGetField(http_.get(), HTTP_FIELD_CONNECTION), "close") != 0;
}

void IppConnection::connect() {
    const auto deadline = Deadline::after(kConnectLimit);
    const auto addresses = HostAddresses::find(peer_.host, peer_.port, deadline);
    if (!addresses.list) {
        failure_ = addresses.failure;
        return;
    }
    // The handle comes first and the connection second, so that a TLS handshake is guarded too.
    constexpr int kConnectLater = 0;
    http_.reset(httpConnect2(peer_.host.c_str(), peer_.port, addresses.list.get(), AF_UNSPEC,
                             peer_.encryption, 1, kConnectLater, nullptr));
    if (http_ && reconnect(deadline))
        return;
    failure_ = deadline.passed() ? "no connection within " + seconds(kConnectLimit)
                                 : connectFailure(addresses.list.get());
    http_.reset();
}

bool IppConnection::reconnect(Deadline deadline) {
    const HttpGuard guard(http_.get(), deadline);
    const auto left =
        std::max(deadline.remaining(), std::chrono::milliseconds(1));  // libcups takes 0 for ever
    return httpReconnect2(http_.get(), static_cast<int>(left.count()), nullptr) == 0;
}

IppAnswer IppConnection::exchange(IppPtr request, const std::string& resource, int document, int received) {
    if (!http_)
        return {nullptr, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE, failure_};

    const auto deadline = Deadline::after(limit_);
    auto answer = exchangeBy(deadline, request.get(), resource, document, received);
    const bool isOverdue = !answer.succeeded() && deadline.passed();
    isSound_ = answer.response && !isOverdue;
    if (role_ == Role::Scheduler)
        isSchedulerSilent = isOverdue;
    if (isOverdue)
        return {nullptr, IPP_STATUS_ERROR_INTERNAL, "no complete answer within " + seconds(limit_)};
    return answer;
}

IppAnswer IppConnection::exchangeBy(Deadline deadline, ipp_t* request, const std::string& resource,
                                    int document, int received) {
    const auto connecting = Deadline::after(std::min(kConnectLimit, deadline.remaining()));
    const bool wasUsed = std::exchange(isUsed_, true);
    if (wasUsed && hasEnded(http_.get()) && !reconnect(connecting))
        return {nullptr, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE, "it has hung up"};

    const auto attempt = [&] {
        const HttpGuard guard(http_.get(), deadline);
        return exchangeOver(http_.get(), request, resource, document, received);
    };
    auto [answer, heardNothing] = attempt();
    // The peer may have hung up just when the request was on its way.
    if (heardNothing && wasUsed && isQuestion(request) && !deadline.passed() && reconnect(connecting))
        return attempt().answer;
    return std::move(answer);
}

}  // namespace ventras
