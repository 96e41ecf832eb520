#include "tests/parts/UsbTransfer.h"

#include <cerrno>
#include <utility>

namespace ventras {

UsbTransfer UsbTransfer::control(FakePrinter& printer, const UsbSetup& setup, std::size_t room) {
    UsbTransfer transfer(printer, 0, room);
    transfer.take(printer.control(setup));
    return transfer;
}

UsbTransfer UsbTransfer::bulkOut(FakePrinter& printer, std::uint8_t endpoint, std::string_view data) {
    UsbTransfer transfer(printer, endpoint, 0);
    auto answer = printer.bulkOut(endpoint, data);
    answer.data.clear();
    transfer.sent_ = answer.error == 0 ? data.size() : 0;
    transfer.take(std::move(answer));
    return transfer;
}

UsbTransfer UsbTransfer::bulkIn(FakePrinter& printer, std::uint8_t endpoint, std::size_t room) {
    return {printer, endpoint, room};
}

void UsbTransfer::take(std::optional<UsbAnswer> answer) {
    if (!answer)
        return;
    due_ = Clock::now() + answer->after;
    answer_ = std::move(answer);
}

std::optional<UsbOutcome> UsbTransfer::outcome() {
    if (!answer_)
        take(printer_->bulkIn(endpoint_, room_));
    if (!answer_ || answer_->error == ETIMEDOUT || Clock::now() < due_)
        return std::nullopt;
    auto [error, data, after] = *answer_;
    if (data.size() > room_) {
        error = EOVERFLOW;
        data.resize(room_);
    }
    return UsbOutcome{error, sent_ + data.size(), std::move(data)};
}

}  // namespace ventras
