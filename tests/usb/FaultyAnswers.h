#pragma once

#include <cerrno>
#include <chrono>
#include <cstdint>
#include <vector>

#include "platform/UsbControlRequest.h"
#include "tests/parts/FakePrinter.h"

namespace ventras {

/// What a device may answer to a request for 256 bytes, and what the registry makes of it.
struct FaultyAnswer {
    const char* name;
    UsbAnswer answer;
    UsbStatus status;
    std::uint32_t bytes;
};

/// @param wait the request's time-out
inline std::vector<FaultyAnswer> faultyAnswers(std::chrono::milliseconds wait) {
    return {
        {"STALL", UsbAnswer::stall(), UsbStatus::kStall, 0},
        {"no answer", UsbAnswer::silence(), UsbStatus::kTimeOut, 0},
        {"overrun", {EOVERFLOW, {0, 9}, {}}, UsbStatus::kOverrun, 0},
        {"more than asked for", {0, UsbBytes(300, 'x'), {}}, UsbStatus::kOverrun, 0},
        {"protocol error", {EPROTO, {}, {}}, UsbStatus::kFailed, 0},
        {"unplugged meanwhile", {ESHUTDOWN, {}, {}}, UsbStatus::kNoDevice, 0},
        {"nothing", {}, UsbStatus::kSuccess, 0},
        {"one byte", {0, {1}, {}}, UsbStatus::kSuccess, 1},
        {"late, but in time", {0, {0, 3, 'x'}, wait / 2}, UsbStatus::kSuccess, 3},
        {"too late", {0, {0, 3, 'x'}, wait * 2}, UsbStatus::kTimeOut, 0},
    };
}

}  // namespace ventras
