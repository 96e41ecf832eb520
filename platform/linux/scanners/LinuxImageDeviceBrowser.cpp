#include "platform/linux/scanners/LinuxImageDeviceBrowser.h"

#include <algorithm>

namespace ventras {
namespace {

constexpr std::uint64_t kScanners = 0x2;
constexpr std::uint64_t kReachable = 0x100;
constexpr std::uint64_t kRegisteredHere = 0xfe00;

}  // namespace

LinuxImageDeviceBrowser::LinuxImageDeviceBrowser() : events_([this] { handleEvents(); }) {}

void LinuxImageDeviceBrowser::start() {
    if ((mask_ & kScanners) == 0 || (mask_ & kReachable) == 0)
        return;
    const auto post = [this](ScannerEvent event) { events_.post(std::move(event)); };
    usb_.emplace(post);
    network_.emplace(
        (mask_ & kRegisteredHere) != 0 ? ScannerServices::AlsoOfThisComputer : ScannerServices::OfTheNetwork,
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
