#include "platform/IppConnection.h"

#include <sys/socket.h>

#include <system_error>

#include "platform/HttpGuard.h"

namespace ventras {
namespace {

// libcups would ask on the terminal; an agent without windows has nobody to ask.
const char* refusePassword(const char*, http_t*, const char*, const char*, void*) {
    return nullptr;
}

std::string seconds(std::chrono::milliseconds time) {
    return std::to_string(std::chrono::ceil<std::chrono::seconds>(time).count()) + " s";
}

}  // namespace

IppConnection IppConnection::toPrinter(const std::string& host, int port, http_encryption_t encryption,
                                       std::chrono::milliseconds limit) {
    return IppConnection{host, port, encryption, limit};
}

IppConnection IppConnection::toScheduler(std::chrono::milliseconds limit) {
    return IppConnection{cupsServer(), ippPort(), cupsEncryption(), limit};
}

IppConnection::IppConnection(const std::string& host, int port, http_encryption_t encryption,
                             std::chrono::milliseconds limit)
    : limit_(limit) {
    constexpr int kConnectLater = 0;
    http_.reset(httpConnect2(host.c_str(), port, nullptr, AF_UNSPEC, encryption, 1, kConnectLater, nullptr));
    if (!http_) {
        failure_ = cupsLastErrorString();
        return;
    }

    // The handle comes first and the connection second, so that a TLS handshake is guarded too.
    int failed = 0;
    {
        const HttpGuard guard(http_.get(), Deadline::after(kConnectLimit));
        failed = httpReconnect2(http_.get(), static_cast<int>(kConnectLimit.count()), nullptr);
    }
    if (failed != 0) {
        const int error = httpError(http_.get());
        failure_ = error != 0 ? std::generic_category().message(error) : cupsLastErrorString();
        http_.reset();
    }
}

IppAnswer IppConnection::exchange(IppPtr request, const std::string& resource, int document, int received) {
    if (!http_)
        return {nullptr, IPP_STATUS_ERROR_SERVICE_UNAVAILABLE, failure_};

    cupsSetPasswordCB2(refusePassword, nullptr);
    const auto deadline = Deadline::after(limit_);
    const HttpGuard guard(http_.get(), deadline);
    IppPtr response{cupsDoIORequest(http_.get(), request.release(), resource.c_str(), document, received)};

    IppAnswer answer{std::move(response), cupsLastError(), cupsLastErrorString()};
    if (answer.response && answer.succeeded())
        return answer;
    if (deadline.passed())
        answer = {nullptr, IPP_STATUS_ERROR_INTERNAL, "no complete answer within " + seconds(limit_)};
    else if (!answer.response && answer.succeeded())
        answer.status = IPP_STATUS_ERROR_INTERNAL;
    return answer;
}

}  // namespace ventras
