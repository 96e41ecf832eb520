#include "platform/IppConnection.h"

#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>

#include "platform/ConnectFailure.h"
#include "platform/HttpGuard.h"

namespace ventras {
namespace {

// The agent asks the scheduler several things, one after another and by many threads. One that hangs would
// hold it for as many limits.
std::atomic<bool> isSchedulerSilent = false;

// libcups would ask on the terminal; an agent without windows has nobody to ask.
const char* refusePassword(const char*, http_t*, const char*, const char*, void*) {
    return nullptr;
}

std::string seconds(std::chrono::milliseconds time) {
    return std::to_string(std::chrono::ceil<std::chrono::seconds>(time).count()) + " s";
}

std::string lastErrorText() {
    const char* text = cupsLastErrorString();
    return text != nullptr ? text : "no reason given";
}

// A challenge is answered once, an upgrade to TLS is followed once; whoever then still wants something else,
// like a redirection to itself, would be asked for ever.
constexpr int kMostAttempts = 3;

constexpr std::size_t kBlock = 65536;

struct HttpRefusal {
    http_status_t status;
    ipp_status_t meaning;
};

constexpr std::array kHttpRefusals{
    HttpRefusal{HTTP_STATUS_BAD_REQUEST, IPP_STATUS_ERROR_BAD_REQUEST},
    HttpRefusal{HTTP_STATUS_UNAUTHORIZED, IPP_STATUS_ERROR_NOT_AUTHENTICATED},
    HttpRefusal{HTTP_STATUS_FORBIDDEN, IPP_STATUS_ERROR_FORBIDDEN},
    HttpRefusal{HTTP_STATUS_NOT_FOUND, IPP_STATUS_ERROR_NOT_FOUND},
    HttpRefusal{HTTP_STATUS_REQUEST_TOO_LARGE, IPP_STATUS_ERROR_REQUEST_VALUE},
    HttpRefusal{HTTP_STATUS_NOT_IMPLEMENTED, IPP_STATUS_ERROR_OPERATION_NOT_SUPPORTED},
    HttpRefusal{HTTP_STATUS_NOT_SUPPORTED, IPP_STATUS_ERROR_VERSION_NOT_SUPPORTED},
    HttpRefusal{HTTP_STATUS_UPGRADE_REQUIRED, IPP_STATUS_ERROR_CUPS_UPGRADE_REQUIRED},
    HttpRefusal{HTTP_STATUS_SERVICE_UNAVAILABLE, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE},
};

// Why there is no IPP answer: libcups' own texts are then left-overs of earlier system calls.
IppAnswer unanswered(http_t* http) {
    const auto status = httpGetStatus(http);
    if (status == HTTP_STATUS_CUPS_AUTHORIZATION_CANCELED)
        return {nullptr, IPP_STATUS_ERROR_CUPS_AUTHENTICATION_CANCELED, "a password is asked for"};
    if (status >= HTTP_STATUS_MULTIPLE_CHOICES) {
        const auto row = std::ranges::find(kHttpRefusals, status, &HttpRefusal::status);
        const auto meaning = row == kHttpRefusals.end() ? IPP_STATUS_ERROR_INTERNAL : row->meaning;
        return {nullptr, meaning, "HTTP " + std::to_string(status) + " " + httpStatus(status)};
    }
    const int error = httpError(http);
    const bool telling = error != 0 && error != EBADF;
    return {nullptr, IPP_STATUS_ERROR_INTERNAL,
            telling ? "no IPP answer: " + std::generic_category().message(error) : "no IPP answer"};
}

// 0 = chunked, for what is no regular file.
std::size_t requestLength(ipp_t* request, int document) {
    struct stat file {};
    if (document < 0)
        return ippLength(request);
    if (fstat(document, &file) != 0 || !S_ISREG(file.st_mode))
        return 0;
    return ippLength(request) + static_cast<std::size_t>(file.st_size);
}

http_status_t sendDocument(http_t* http, int document) {
    lseek(document, 0, SEEK_SET);
    std::array<char, kBlock> block;
    auto status = HTTP_STATUS_CONTINUE;
    for (ssize_t length = 0;
         status == HTTP_STATUS_CONTINUE && (length = read(document, block.data(), block.size())) > 0;)
        status = cupsWriteRequestData(http, block.data(), static_cast<std::size_t>(length));
    return status;
}

IppPtr attempt(http_t* http, ipp_t* request, const std::string& resource, int document) {
    auto status = cupsSendRequest(http, request, resource.c_str(), requestLength(request, document));
    if (status == HTTP_STATUS_CONTINUE && document >= 0)
        status = sendDocument(http, document);
    if (status > HTTP_STATUS_CONTINUE && status != HTTP_STATUS_OK)
        return nullptr;
    return IppPtr{cupsGetResponse(http, resource.c_str())};
}

bool asksAgain(http_status_t status) {
    return status == HTTP_STATUS_UNAUTHORIZED || status == HTTP_STATUS_UPGRADE_REQUIRED;
}

// Takes what follows the answer. False when it ended too early or could not be kept.
bool receiveDocument(http_t* http, int received) {
    std::array<char, kBlock> block;
    for (ssize_t length = 0; (length = httpRead2(http, block.data(), block.size())) > 0;)
        if (write(received, block.data(), static_cast<std::size_t>(length)) != length)
            return false;
    return httpGetState(http) == HTTP_STATE_WAITING;
}

}  // namespace

IppConnection IppConnection::toPrinter(const std::string& host, int port, http_encryption_t encryption,
                                       std::chrono::milliseconds limit) {
    return IppConnection{Peer::Printer, host, port, encryption, limit};
}

IppConnection IppConnection::toScheduler(std::chrono::milliseconds limit) {
    return IppConnection{Peer::Scheduler, cupsServer(), ippPort(), cupsEncryption(),
                         isSchedulerSilent ? std::min(limit, kImpatientLimit) : limit};
}

IppConnection::IppConnection(Peer peer, const std::string& host, int port, http_encryption_t encryption,
                             std::chrono::milliseconds limit)
    : peer_(peer), limit_(limit) {
    constexpr int kConnectLater = 0;
    http_.reset(httpConnect2(host.c_str(), port, nullptr, AF_UNSPEC, encryption, 1, kConnectLater, nullptr));
    if (!http_) {
        failure_ = connectFailure(host, port);
        return;
    }

    // The handle comes first and the connection second, so that a TLS handshake is guarded too.
    const auto deadline = Deadline::after(kConnectLimit);
    int failed = 0;
    {
        const HttpGuard guard(http_.get(), deadline);
        failed = httpReconnect2(http_.get(), static_cast<int>(kConnectLimit.count()), nullptr);
    }
    if (failed != 0) {
        failure_ =
            deadline.passed() ? "no connection within " + seconds(kConnectLimit) : connectFailure(host, port);
        http_.reset();
    }
}

IppAnswer IppConnection::exchange(IppPtr request, const std::string& resource, int document, int received) {
    if (!http_)
        return {nullptr, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE, failure_};

    const auto deadline = Deadline::after(limit_);
    auto answer = exchangeBy(deadline, std::move(request), resource, document, received);
    const bool isOverdue = !answer.succeeded() && deadline.passed();
    if (peer_ == Peer::Scheduler)
        isSchedulerSilent = isOverdue;
    if (isOverdue)
        return {nullptr, IPP_STATUS_ERROR_INTERNAL, "no complete answer within " + seconds(limit_)};
    return answer;
}

IppAnswer IppConnection::exchangeBy(Deadline deadline, IppPtr request, const std::string& resource,
                                    int document, int received) {
    cupsSetPasswordCB2(refusePassword, nullptr);
    const HttpGuard guard(http_.get(), deadline);
    IppPtr response;
    for (int i = 0; i < kMostAttempts && !response; ++i) {
        response = attempt(http_.get(), request.get(), resource, document);
        if (!response && !asksAgain(httpGetStatus(http_.get())))
            break;
    }

    IppAnswer answer =
        response ? IppAnswer{std::move(response), cupsLastError(), lastErrorText()} : unanswered(http_.get());
    if (answer.response && received >= 0 && !receiveDocument(http_.get(), received))
        answer = {nullptr, IPP_STATUS_ERROR_INTERNAL, "the document that came back is incomplete"};
    if (httpGetState(http_.get()) != HTTP_STATE_WAITING)
        httpFlush(http_.get());
    return answer;
}

}  // namespace ventras
