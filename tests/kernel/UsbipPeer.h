#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <map>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "tests/parts/FakePrinter.h"
#include "tests/parts/UsbTransfer.h"

namespace ventras {

/// The device's end of a USB/IP connection (Documentation/usb/usbip_protocol.rst of the kernel) with a
/// FakePrinter behind it. Serves in a thread of its own; any thread may ask.
class UsbipPeer {
public:
    /// @param socket the connection, past its handshake; the kernel has the other end
    /// @param printer outlives the peer
    UsbipPeer(FileDescriptor socket, FakePrinter& printer);
    UsbipPeer(const UsbipPeer&) = delete;
    UsbipPeer& operator=(const UsbipPeer&) = delete;
    /// Hangs up: the device is unplugged.
    ~UsbipPeer();

    /// How many transfers the kernel has taken back before they were answered.
    int takenBack() const { return takenBack_; }

private:
    using Record = std::array<std::uint32_t, 12>;

    void serve();
    bool handleRecord();
    bool submit(const Record& record);
    bool unlink(const Record& record);
    bool answerWhatIsDone();

    FileDescriptor socket_;
    FakePrinter& printer_;
    std::map<std::uint32_t, UsbTransfer> pending_;  // by sequence number
    std::atomic<int> takenBack_ = 0;
    std::thread thread_;
};

}  // namespace ventras
