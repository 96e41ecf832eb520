#pragma once

#include <chrono>
#include <cstdint>
#include <vector>

namespace ventras {

/// How one USB request ended.
enum class UsbStatus {
    kSuccess = 0,
    kStall,         ///< the device refuses the request
    kTimeOut,       ///< no answer in time
    kOverrun,       ///< the device sent more than it was asked for
    kUnderrun,      ///< the device sent less, and the platform counts that as an error
    kNoDevice,      ///< it is gone
    kAccessDenied,  ///< the user may not use it
    kFailed,
};

/// One request on the default control pipe (USB 2.0 section 9.3).
struct UsbControlRequest {
    std::uint8_t bmRequestType = 0;
    std::uint8_t bRequest = 0;
    std::uint16_t wValue = 0;
    std::uint16_t wIndex = 0;
    std::uint16_t wLength = 0;
    std::vector<std::uint8_t> data;                  ///< filled in: wLength bytes, zero where none came
    std::uint32_t bytesTransferred = 0;              ///< filled in: how many bytes of `data` came
    std::chrono::milliseconds noDataTimeOut{0};      ///< longest wait for an answer; 0 = the platform's own
    std::chrono::milliseconds completionTimeOut{0};  ///< longest time for the whole request; 0 = none
};

}  // namespace ventras
