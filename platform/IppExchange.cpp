#include "platform/IppExchange.h"

#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/IppConnection.h"
#include "platform/ResponseBody.h"

namespace ventras {
namespace {

// libcups would ask on the terminal; an agent without windows has nobody to ask.
const char* refusePassword(const char*, http_t*, const char*, const char*, void*) {
    return nullptr;
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
IppAnswer unanswered(http_t* http, http_status_t status) {
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

// libcups hands out whatever number a peer sent, which need not be one that its enumerations can hold.
http_status_t knownHttp(int status) {
    const bool isKnown = status >= HTTP_STATUS_ERROR && status <= HTTP_STATUS_CUPS_WEBIF_DISABLED;
    return isKnown ? static_cast<http_status_t>(status) : HTTP_STATUS_ERROR;
}

ipp_status_t knownIpp(int status) {
    const bool isKnown = status >= IPP_STATUS_OK && status <= IPP_STATUS_ERROR_CUPS_UPGRADE_REQUIRED;
    return isKnown ? static_cast<ipp_status_t>(status) : IPP_STATUS_ERROR_INTERNAL;
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
        status = knownHttp(cupsWriteRequestData(http, block.data(), static_cast<std::size_t>(length)));
    return status;
}

// What came of one attempt at an exchange.
struct Attempt {
    IppPtr response;
    http_status_t status;
};

bool asksAgain(http_status_t status) {
    return status == HTTP_STATUS_UNAUTHORIZED || status == HTTP_STATUS_UPGRADE_REQUIRED;
}

// Reads what is left of an answer, so that the connection is ready for the next request; a peer that does not
// come to an end is left.
void finish(http_t* http) {
    std::array<char, kBlock> rest;
    for (std::size_t seen = 0; httpGetState(http) != HTTP_STATE_WAITING && seen < kBlock;) {
        const auto length = httpRead2(http, rest.data(), rest.size());
        if (length <= 0)
            break;
        seen += static_cast<std::size_t>(length);
    }
    if (httpGetState(http) == HTTP_STATE_WAITING)
        return;
    shutdown(httpGetFd(http), SHUT_RDWR);
    httpFlush(http);  // at an end now; only this frees what unpacks an answer
}

// Does what the peer wants before it carries the request out, so that a further attempt makes sense.
http_status_t comply(http_t* http, http_status_t status, const std::string& resource) {
    finish(http);
    if (status == HTTP_STATUS_UNAUTHORIZED && cupsDoAuthentication(http, "POST", resource.c_str()) != 0)
        return HTTP_STATUS_CUPS_AUTHORIZATION_CANCELED;
    if (asksAgain(status))
        httpReconnect2(http, static_cast<int>(IppConnection::kConnectLimit.count()), nullptr);
    if (status == HTTP_STATUS_UPGRADE_REQUIRED)
        httpEncryption(http, HTTP_ENCRYPTION_REQUIRED);
    return status;
}

http_status_t send(http_t* http, ipp_t* request, const std::string& resource, int document) {
    const auto length = requestLength(request, document);
    auto status = knownHttp(cupsSendRequest(http, request, resource.c_str(), length));
    if (status == HTTP_STATUS_CONTINUE && document >= 0)
        status = sendDocument(http, document);
    if (status == HTTP_STATUS_CONTINUE && length == 0)
        httpWrite2(http, "", 0);  // the last chunk
    return status;
}

Attempt attempt(http_t* http, ipp_t* request, const std::string& resource, int document, ResponseBody& body) {
    auto status = send(http, request, resource, document);
    if (status > HTTP_STATUS_CONTINUE && status != HTTP_STATUS_OK)
        return {nullptr, knownHttp(httpGetStatus(http))};
    // Where libcups has connected again by itself it waits for a request, and would say "continue" for ever.
    do
        status = knownHttp(httpUpdate(http));
    while (status == HTTP_STATUS_CONTINUE && httpGetState(http) != HTTP_STATE_WAITING);
    if (status == HTTP_STATUS_OK)
        return {body.readMessage(), status};
    return {nullptr, comply(http, status, resource)};
}

IppAnswer answered(IppPtr response) {
    const auto status = knownIpp(ippGetStatusCode(response.get()));
    auto* attribute = ippFindAttribute(response.get(), "status-message", IPP_TAG_TEXT);
    const char* message = attribute == nullptr ? nullptr : ippGetString(attribute, 0, nullptr);
    return {std::move(response), status, message != nullptr ? message : ippErrorString(status)};
}

}  // namespace

IppExchange exchangeOver(http_t* http, ipp_t* request, const std::string& resource, int document,
                         int received) {
    cupsSetPasswordCB2(refusePassword, nullptr);
    ResponseBody body(http);
    Attempt last{nullptr, HTTP_STATUS_UNAUTHORIZED};
    for (int i = 0; i < kMostAttempts && !last.response && asksAgain(last.status); ++i)
        last = attempt(http, request, resource, document, body);

    const bool heardNothing = !last.response && last.status == HTTP_STATUS_ERROR;
    auto answer = last.response ? answered(std::move(last.response)) : unanswered(http, last.status);
    if (answer.response && received >= 0 && !body.copyDocument(received))
        answer = {nullptr, IPP_STATUS_ERROR_INTERNAL, "the document that came back is incomplete"};
    finish(http);
    return {std::move(answer), heardNothing};
}

}  // namespace ventras
