#pragma once

#include <string>

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

}  // namespace ventras
