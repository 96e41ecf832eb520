#include "tests/kernel/UsbipPeer.h"

#include <endian.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <utility>

namespace ventras {
namespace {

// The words of a record.
constexpr std::size_t kCommand = 0;
constexpr std::size_t kSequence = 1;
constexpr std::size_t kDirection = 3;
constexpr std::size_t kEndpoint = 4;
constexpr std::size_t kVictim = 5;   // of UNLINK
constexpr std::size_t kLength = 6;   // of SUBMIT
constexpr std::size_t kSetup = 10;   // of SUBMIT, 8 bytes as they are
constexpr std::size_t kStatus = 5;   // of both answers
constexpr std::size_t kActual = 6;   // of the answer to SUBMIT
constexpr std::size_t kPackets = 8;  // of the answer to SUBMIT
constexpr std::size_t kWords = 10;

constexpr std::uint32_t kSubmit = 1;
constexpr std::uint32_t kUnlink = 2;
constexpr std::uint32_t kSubmitAnswer = 3;
constexpr std::uint32_t kUnlinkAnswer = 4;
constexpr std::uint32_t kIn = 1;
constexpr std::uint32_t kNotIsochronous = 0xFFFFFFFF;
constexpr std::uint8_t kInAddress = 0x80;

// How often the printer is asked whether it has something to say by now.
constexpr int kPauseMilliseconds = 5;

bool receiveAll(int socket, void* bytes, std::size_t size) {
    return size == 0 || recv(socket, bytes, size, MSG_WAITALL) == static_cast<ssize_t>(size);
}

bool sendAll(int socket, const void* bytes, std::size_t size) {
    const auto* next = static_cast<const char*>(bytes);
    while (size > 0) {
        const auto sent = send(socket, next, size, MSG_NOSIGNAL);
        if (sent < 0)
            return false;
        next += sent;
        size -= static_cast<std::size_t>(sent);
    }
    return true;
}

/// Between the bytes of the connection and those of this machine; the same both ways.
template <class Record>
void swapWords(Record& record) {
    for (auto& word : std::span(record).template first<kWords>())
        word = be32toh(word);
}

template <class Record>
bool sendRecord(int socket, Record record) {
    swapWords(record);
    return sendAll(socket, record.data(), sizeof record);
}

std::uint32_t statusOf(int error) {
    return static_cast<std::uint32_t>(-error);
}

}  // namespace

UsbipPeer::UsbipPeer(FileDescriptor socket, FakePrinter& printer)
    : socket_(std::move(socket)), printer_(printer), thread_([this] { serve(); }) {}

UsbipPeer::~UsbipPeer() {
    shutdown(socket_.get(), SHUT_RDWR);
    thread_.join();
}

void UsbipPeer::serve() {
    bool isConnected = true;
    while (isConnected) {
        pollfd ready{socket_.get(), POLLIN, 0};
        const int count = poll(&ready, 1, pending_.empty() ? -1 : kPauseMilliseconds);
        isConnected = (count <= 0 || handleRecord()) && answerWhatIsDone();
    }
    shutdown(socket_.get(), SHUT_RDWR);
}

bool UsbipPeer::handleRecord() {
    Record record{};
    if (!receiveAll(socket_.get(), record.data(), sizeof record))
        return false;
    swapWords(record);
    switch (record[kCommand]) {
        case kSubmit:
            return submit(record);
        case kUnlink:
            return unlink(record);
        default:
            return false;
    }
}

bool UsbipPeer::submit(const Record& record) {
    const bool isIn = record[kDirection] == kIn;
    const auto endpoint = static_cast<std::uint8_t>(record[kEndpoint] | (isIn ? kInAddress : 0U));
    std::string data(isIn ? 0 : record[kLength], '\0');
    if (!receiveAll(socket_.get(), data.data(), data.size()))
        return false;
    const auto transfer = [&] {
        if (record[kEndpoint] == 0)
            return UsbTransfer::control(
                printer_, UsbSetup::parse(reinterpret_cast<const std::uint8_t*>(&record[kSetup])),
                isIn ? record[kLength] : 0);
        return isIn ? UsbTransfer::bulkIn(printer_, endpoint, record[kLength])
                    : UsbTransfer::bulkOut(printer_, endpoint, data);
    };
    pending_.emplace(record[kSequence], transfer());
    return true;
}

bool UsbipPeer::unlink(const Record& record) {
    const bool wasPending = pending_.erase(record[kVictim]) > 0;
    takenBack_ += wasPending ? 1 : 0;
    Record answer{kUnlinkAnswer, record[kSequence]};
    answer[kStatus] = statusOf(wasPending ? ECONNRESET : 0);
    return sendRecord(socket_.get(), answer);
}

bool UsbipPeer::answerWhatIsDone() {
    for (auto at = pending_.begin(); at != pending_.end();) {
        const auto outcome = at->second.outcome();
        if (!outcome) {
            ++at;
            continue;
        }
        Record answer{kSubmitAnswer, at->first};
        answer[kStatus] = statusOf(outcome->error);
        answer[kActual] = static_cast<std::uint32_t>(outcome->length);
        answer[kPackets] = kNotIsochronous;
        if (!sendRecord(socket_.get(), answer) ||
            !sendAll(socket_.get(), outcome->data.data(), outcome->data.size()))
            return false;
        at = pending_.erase(at);
    }
    return true;
}

}  // namespace ventras
