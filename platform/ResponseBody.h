#pragma once

#include <array>
#include <cstddef>

#include "platform/Handles.h"
#include "platform/MessageLimits.h"

namespace ventras {

/// The body of an HTTP response with an IPP message and perhaps a document behind it (RFC 8010 section 3.4),
/// read in large blocks: libcups alone makes three system calls for each name and each value in the message.
/// Use it on one thread, and drop it before the connection's next request.
class ResponseBody {
public:
    /// Longest message that is read; a catalogue of all drivers of a distribution has less than 2 MB.
    static constexpr std::size_t kLargestMessage = std::size_t{8} * 1024 * 1024;

    /// @param connection its response's header has been read
    explicit ResponseBody(http_t* connection) : connection_(connection) {}

    /// The message; empty when it is none, ends too early, is too large, nests too deep, or has
    /// too many values.
    IppPtr readMessage();

    /// Writes what follows the message to a file. @return false when it ended too early or cannot be written.
    bool copyDocument(int file);

private:
    static ssize_t give(void* self, ipp_uchar_t* bytes, std::size_t count);
    bool refill();

    http_t* connection_;
    MessageLimits limits_;
    std::array<char, 65536> block_;
    std::size_t begin_ = 0;
    std::size_t end_ = 0;
    std::size_t received_ = 0;
};

}  // namespace ventras
