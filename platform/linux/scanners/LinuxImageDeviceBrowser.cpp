#include "platform/linux/scanners/LinuxImageDeviceBrowser.h"

#include <algorithm>

namespace ventras {

LinuxImageDeviceBrowser::LinuxImageDeviceBrowser() : events_([this] { handleEvents(); }) {}

void LinuxImageDeviceBrowser::start() {
    constexpr auto kNeeded = ImageDeviceTypes::kScanners | ImageDeviceTypes::kReachable;
    if ((mask_ & kNeeded) != kNeeded)
        return;
    const auto post = [this](ScannerEvent event) { events_.post(std::move(event)); };
    usb_.emplace(post);
    network_.emplace((mask_ & ImageDeviceTypes::kRegisteredHere) != 0 ? ScannerServices::AlsoOfThisComputer
                                                                      : ScannerServices::OfTheNetwork,
                     post);
}

std::vector<ImageDevice> LinuxImageDeviceBrowser::devices() const {
    if (usb_)
        usb_->waitForFirstLook();
    handleEvents();
    std::vector<ImageDevice> devices;
    for (const auto& [key, device] : known_)
        devices.push_back(device);
    return devices;
}

void LinuxImageDeviceBrowser::announceNewSoftwareInstalled() {
    if (!usb_)
        return;
    // New software may know, and serve, devices that were strangers before: look again.
    usb_.reset();
    handleEvents();
    std::erase_if(known_,
                  [](const auto& each) { return each.second.transport == ImageDeviceTransport::kUSB; });
    usb_.emplace([this](ScannerEvent event) { events_.post(std::move(event)); });
}

void LinuxImageDeviceBrowser::handleEvents() const {
    for (auto& [kind, key, device] : events_.take()) {
        const auto known = std::ranges::find(known_, key, [](const auto& each) { return each.first; });
        if (kind == ScannerEvent::Kind::Added && known == known_.end()) {
            known_.emplace_back(key, std::move(device));
            if (delegate_ != nullptr)
                delegate_->deviceAdded(known_.back().second);
        } else if (kind == ScannerEvent::Kind::Removed && known != known_.end()) {
            const auto gone = std::move(known->second);
            known_.erase(known);
            if (delegate_ != nullptr)
                delegate_->deviceRemoved(gone);
        }
    }
}

}  // namespace ventras
