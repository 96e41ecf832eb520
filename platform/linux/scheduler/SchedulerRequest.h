#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/IppConnection.h"
#include "platform/PrintSystemService.h"

namespace ventras {

/// Why a call of the print system failed.
struct Refusal {
    std::int32_t status;  ///< a PrintSystemStatus, not kSuccess
    std::string reason;   ///< for the log
};

/// The IPP URI under which the scheduler knows a destination.
std::string queueURI(const std::string& queueID);

/// A request to the scheduler as a whole, in the name of the user of libcups' configuration.
IppPtr schedulerRequest(ipp_op_t operation);

/// A request about one destination.
IppPtr queueRequest(ipp_op_t operation, const std::string& queueID);

/// The scheduler's refusal in our terms; absent when it carried the request out.
std::optional<Refusal> refusalIn(const IppAnswer& answer);

}  // namespace ventras
