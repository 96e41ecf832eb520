#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Deadline.h"
#include "platform/linux/options/UsbPrinterLocator.h"
#include "platform/linux/usb/TerminationHold.h"

namespace ventras {

class UsbPostScriptChannel;

/// A new channel, or why there is none.
struct UsbPostScriptOpening {
    std::unique_ptr<UsbPostScriptChannel> channel;
    std::string failure;
};

/// A conversation with the PostScript interpreter of a USB printer.
///
/// While it lives, the printer's interface belongs to it: the kernel's own driver comes back, and the former
/// setting with it, when it is destroyed, also when the process is told to end meanwhile. Use it on one
/// thread; it goes before its LibusbContext.
class UsbPostScriptChannel {
public:
    /// Opens the printer of a queue's device URI, if it speaks PostScript and talks in both directions. To
    /// any other printer a program would be text to print.
    static UsbPostScriptOpening open(LibusbContext& context, const std::string& deviceURI);

    UsbPostScriptChannel(const UsbPostScriptChannel&) = delete;
    UsbPostScriptChannel& operator=(const UsbPostScriptChannel&) = delete;
    ~UsbPostScriptChannel();

    /// Runs a program as a job of its own.
    /// @return the lines that it printed, perhaps none; absent when the printer does not answer by the
    /// deadline.
    std::optional<std::vector<std::string>> ask(std::string_view program, Deadline deadline);

private:
    UsbPostScriptChannel(UsbPrinterPlace place, LibusbHandle handle);

    int claim();
    bool send(std::string_view text, Deadline deadline);
    std::optional<std::string> receive(std::chrono::milliseconds wait);
    std::string jobs(std::string_view program, std::string_view marker) const;

    UsbPrinterPlace place_;
    TerminationHold hold_;
    LibusbHandle handle_;
    std::uint8_t formerSetting_ = 0;
    bool claimed_ = false;
    int asked_ = 0;
};

}  // namespace ventras
