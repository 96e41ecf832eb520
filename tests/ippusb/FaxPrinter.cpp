#include "tests/ippusb/FaxPrinter.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <string_view>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

constexpr int kJobCompleted = IPP_JSTATE_COMPLETED;
constexpr std::array kOperations{
    IPP_OP_PRINT_JOB,  IPP_OP_VALIDATE_JOB,       IPP_OP_CREATE_JOB, IPP_OP_SEND_DOCUMENT,
    IPP_OP_CANCEL_JOB, IPP_OP_GET_JOB_ATTRIBUTES, IPP_OP_GET_JOBS,   IPP_OP_GET_PRINTER_ATTRIBUTES};

// Without these the scheduler's IPP backend sends a job's options as they stand, the telephone number among
// them.
constexpr std::array kMediaCol{"media-size", "media-source", "media-type"};

bool isService(std::string_view resource) {
    return resource == FaxPrinter::kPrintResource || resource == FaxPrinter::kFaxResource;
}

bool isFax(std::string_view resource) {
    return resource == FaxPrinter::kFaxResource;
}

void describe(ipp_t* answer, std::string_view resource) {
    addDriverlessAttributes(answer,
                            {.name = "Office", .makeAndModel = isFax(resource) ? "Acme Fax" : "Acme Laser"});
    ippAddStrings(answer, IPP_TAG_PRINTER, IPP_TAG_KEYWORD, "media-col-supported",
                  static_cast<int>(kMediaCol.size()), nullptr, kMediaCol.data());
    std::vector<int> operations(kOperations.begin(), kOperations.end());
    ippAddIntegers(answer, IPP_TAG_PRINTER, IPP_TAG_ENUM, "operations-supported",
                   static_cast<int>(operations.size()), operations.data());
}

// The telephone number stands in the first of "destination-uris" (PWG 5100.15).
std::string destinationIn(ipp_t* request) {
    auto* destinations = ippFindAttribute(request, "destination-uris", IPP_TAG_BEGIN_COLLECTION);
    auto* first = destinations == nullptr ? nullptr : ippGetCollection(destinations, 0);
    auto* uri = first == nullptr ? nullptr : ippFindAttribute(first, "destination-uri", IPP_TAG_URI);
    const char* text = uri == nullptr ? nullptr : ippGetString(uri, 0, nullptr);
    return text == nullptr ? "" : text;
}

int jobIn(ipp_t* request) {
    auto* job = ippFindAttribute(request, "job-id", IPP_TAG_INTEGER);
    return job == nullptr ? 0 : ippGetInteger(job, 0);
}

std::string restOfBody(http_t* http) {
    std::string content;
    std::array<char, 65536> buffer{};
    for (ssize_t length = 0; (length = httpRead2(http, buffer.data(), buffer.size())) > 0;)
        content.append(buffer.data(), static_cast<std::size_t>(length));
    return content;
}

void send(http_t* http, ipp_t* answer) {
    httpClearFields(http);
    httpSetField(http, HTTP_FIELD_CONTENT_TYPE, "application/ipp");
    httpSetLength(http, ippLength(answer));
    httpWriteResponse(http, HTTP_STATUS_OK);
    ippWrite(http, answer);
    httpFlushWrite(http);
}

}  // namespace

FaxPrinter::FaxPrinter(FaxService fax)
    : fax_(fax), stop_(eventfd(0, EFD_CLOEXEC)), listener_([this] { accept(); }) {}

FaxPrinter::~FaxPrinter() {
    eventfd_write(stop_, 1);
    listener_.join();
    connections_.clear();
    close(stop_);
}

std::vector<PrintedDocument> FaxPrinter::documents() const {
    const std::lock_guard lock(mutex_);
    return documents_;
}

bool FaxPrinter::receivedWithin(std::chrono::milliseconds limit, std::size_t count) const {
    return comesTrue([&] { return documents().size() >= count; }, limit);
}

void FaxPrinter::accept() {
    for (;;) {
        std::array<pollfd, 2> waiting{{{stop_, POLLIN, 0}, {socket_.descriptor(), POLLIN, 0}}};
        poll(waiting.data(), waiting.size(), -1);
        if (waiting.front().revents != 0)
            return;
        if (http_t* http = httpAcceptConnection(socket_.descriptor(), 1))
            connections_.emplace_back([this, http] { serve(http); });
    }
}

void FaxPrinter::waitForEnd() const {
    pollfd end{stop_, POLLIN, 0};
    poll(&end, 1, -1);
}

void FaxPrinter::serve(http_t* http) {
    const HttpPtr connection{http};
    for (;;) {
        std::array<pollfd, 2> waiting{{{stop_, POLLIN, 0}, {httpGetFd(http), POLLIN, 0}}};
        poll(waiting.data(), waiting.size(), -1);
        if (waiting.front().revents != 0 || !serveRequest(http))
            return;
    }
}

bool FaxPrinter::serveRequest(http_t* http) {
    std::array<char, HTTP_MAX_URI> resource{};
    http_state_t state = HTTP_STATE_WAITING;
    while ((state = httpReadRequest(http, resource.data(), resource.size())) == HTTP_STATE_WAITING) {
    }
    if (state != HTTP_STATE_POST)
        return false;
    http_status_t status = HTTP_STATUS_CONTINUE;
    while ((status = httpUpdate(http)) == HTTP_STATUS_CONTINUE) {
    }
    if (status != HTTP_STATUS_OK)
        return false;
    if (httpGetExpect(http) == HTTP_STATUS_CONTINUE)
        httpWriteResponse(http, HTTP_STATUS_CONTINUE);
    const IppPtr request{ippNew()};
    ipp_state_t read = IPP_STATE_IDLE;
    while ((read = ippRead(http, request.get())) != IPP_STATE_DATA)
        if (read == IPP_STATE_ERROR)
            return false;
    auto content = restOfBody(http);
    if (fax_ == FaxService::Hangs && isFax(resource.data())) {
        waitForEnd();
        return false;
    }
    const auto reply = answer(request.get(), resource.data(), std::move(content));
    send(http, reply.get());
    return true;
}

IppPtr FaxPrinter::answer(ipp_t* request, const std::string& resource, std::string content) {
    IppPtr reply{ippNewResponse(request)};
    if (!isService(resource)) {
        ippSetStatusCode(reply.get(), IPP_STATUS_ERROR_NOT_FOUND);
        return reply;
    }
    const std::lock_guard lock(mutex_);
    int job = jobIn(request);
    switch (ippGetOperation(request)) {
        case IPP_OP_GET_PRINTER_ATTRIBUTES:
            describe(reply.get(), resource);
            return reply;
        case IPP_OP_VALIDATE_JOB:
            return reply;
        case IPP_OP_CREATE_JOB:
            job = ++lastJob_;
            destinations_[job] = destinationIn(request);
            break;
        case IPP_OP_PRINT_JOB:
            job = ++lastJob_;
            documents_.push_back({resource, destinationIn(request), std::move(content)});
            break;
        case IPP_OP_SEND_DOCUMENT:
            documents_.push_back({resource, destinations_[job], std::move(content)});
            break;
        case IPP_OP_GET_JOB_ATTRIBUTES:
        case IPP_OP_CANCEL_JOB:
            break;
        default:
            ippSetStatusCode(reply.get(), IPP_STATUS_ERROR_OPERATION_NOT_SUPPORTED);
            return reply;
    }
    addJob(reply.get(), job);
    return reply;
}

void FaxPrinter::addJob(ipp_t* reply, int job) const {
    const auto uri = "ipp://localhost:" + std::to_string(port()) + "/jobs/" + std::to_string(job);
    ippAddInteger(reply, IPP_TAG_JOB, IPP_TAG_INTEGER, "job-id", job);
    ippAddString(reply, IPP_TAG_JOB, IPP_TAG_URI, "job-uri", nullptr, uri.c_str());
    ippAddInteger(reply, IPP_TAG_JOB, IPP_TAG_ENUM, "job-state", kJobCompleted);
    ippAddString(reply, IPP_TAG_JOB, IPP_TAG_KEYWORD, "job-state-reasons", nullptr,
                 "job-completed-successfully");
}

}  // namespace ventras
