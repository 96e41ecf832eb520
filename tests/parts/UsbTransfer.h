#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include "tests/parts/FakePrinter.h"

namespace ventras {

/// How a transfer ended.
struct UsbOutcome {
    int error = 0;           ///< errno; 0 when it went well
    std::size_t length = 0;  ///< how many bytes were moved
    UsbBytes data{};         ///< those that came in
};

/// One transfer between a host and a FakePrinter, whatever carries it. What the printer takes has happened
/// from the start, even if nobody waits for it any more; its answer may be late, never come, or not fit. One
/// thread at a time.
class UsbTransfer {
public:
    /// @param room how many bytes of an answer there is room for
    static UsbTransfer control(FakePrinter& printer, const UsbSetup& setup, std::size_t room);
    static UsbTransfer bulkOut(FakePrinter& printer, std::uint8_t endpoint, std::string_view data);
    /// Begins with the first outcome() that is asked for.
    static UsbTransfer bulkIn(FakePrinter& printer, std::uint8_t endpoint, std::size_t room);

    /// Absent while it is under way. An answer that does not fit is cut, and an EOVERFLOW.
    std::optional<UsbOutcome> outcome();

private:
    using Clock = std::chrono::steady_clock;

    UsbTransfer(FakePrinter& printer, std::uint8_t endpoint, std::size_t room)
        : printer_(&printer), endpoint_(endpoint), room_(room) {}
    void take(std::optional<UsbAnswer> answer);

    FakePrinter* printer_;
    std::uint8_t endpoint_;
    std::size_t room_;
    std::size_t sent_ = 0;
    std::optional<UsbAnswer> answer_;
    Clock::time_point due_;
};

}  // namespace ventras
