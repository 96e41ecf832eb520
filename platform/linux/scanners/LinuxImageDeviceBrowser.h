#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/ImageDeviceBrowser.h"
#include "platform/linux/scanners/NetworkScannerWatch.h"
#include "platform/linux/scanners/ScannerEvents.h"
#include "platform/linux/scanners/UsbScannerWatch.h"

namespace ventras {

/// Scanners on the USB and on the network, as udev and DNS-SD announce them.
///
/// Without both kScanners and kReachable in the type mask it looks for nothing. Starting and stopping take
/// milliseconds. Main thread only.
class LinuxImageDeviceBrowser final : public ImageDeviceBrowser {
public:
    LinuxImageDeviceBrowser();

    void setDelegate(Delegate* delegate) override { delegate_ = delegate; }
    void setBrowsedDeviceTypeMask(std::uint64_t mask) override { mask_ = mask; }
    std::uint64_t browsedDeviceTypeMask() const override { return mask_; }
    void start() override;
    std::vector<ImageDevice> devices() const override;
    void announceNewSoftwareInstalled() override;

private:
    void handleEvents() const;

    // Reading the list takes in what has been posted meanwhile.
    mutable std::vector<std::pair<std::string, ImageDevice>> known_;
    mutable ScannerEvents events_;
    Delegate* delegate_ = nullptr;
    std::uint64_t mask_ = 0;
    mutable std::optional<UsbScannerWatch> usb_;
    std::optional<NetworkScannerWatch> network_;
};

}  // namespace ventras
