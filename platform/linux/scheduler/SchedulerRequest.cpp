#include "platform/linux/scheduler/SchedulerRequest.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace ventras {
namespace {

struct StatusRow {
    ipp_status_t answer;
    std::int32_t status;
};

// Whatever is not listed is the scheduler's own objection to the queue.
constexpr std::array kStatuses{
    StatusRow{IPP_STATUS_ERROR_FORBIDDEN, PrintSystemStatus::kNoPermission},
    StatusRow{IPP_STATUS_ERROR_NOT_AUTHENTICATED, PrintSystemStatus::kNoPermission},
    StatusRow{IPP_STATUS_ERROR_NOT_AUTHORIZED, PrintSystemStatus::kNoPermission},
    StatusRow{IPP_STATUS_ERROR_CUPS_AUTHENTICATION_CANCELED, PrintSystemStatus::kNoPermission},
    StatusRow{IPP_STATUS_ERROR_SERVICE_UNAVAILABLE, PrintSystemStatus::kUnavailable},
    StatusRow{IPP_STATUS_ERROR_BUSY, PrintSystemStatus::kUnavailable},
};

// RFC 3986 section 2.3. libcups would leave "?" in a name as the mark of a query.
bool isUnreserved(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
           std::string_view("-._~").find(c) != std::string_view::npos;
}

std::string percentEncoded(std::string_view text) {
    constexpr std::string_view kDigits = "0123456789ABCDEF";
    std::string encoded;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (isUnreserved(c))
            encoded += c;
        else
            encoded += {'%', kDigits[byte >> 4U], kDigits[byte & 0xFU]};
    }
    return encoded;
}

}  // namespace

std::string queueURI(const std::string& queueID) {
    return "ipp://localhost/printers/" + percentEncoded(queueID);
}

IppPtr schedulerRequest(ipp_op_t operation) {
    IppPtr request{ippNewRequest(operation)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "requesting-user-name", nullptr, cupsUser());
    return request;
}

IppPtr queueRequest(ipp_op_t operation, const std::string& queueID) {
    IppPtr request{ippNewRequest(operation)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 queueURI(queueID).c_str());
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "requesting-user-name", nullptr, cupsUser());
    return request;
}

std::optional<Refusal> refusalIn(const IppAnswer& answer) {
    if (answer.succeeded())
        return std::nullopt;
    const auto row = std::ranges::find(kStatuses, answer.status, &StatusRow::answer);
    if (row != kStatuses.end())
        return Refusal{row->status, answer.reason};
    const auto status = answer.response ? PrintSystemStatus::kCannotCreate : PrintSystemStatus::kUnavailable;
    return Refusal{status, answer.reason};
}

}  // namespace ventras
