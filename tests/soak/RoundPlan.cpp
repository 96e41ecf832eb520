#include "tests/soak/RoundPlan.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <random>

namespace ventras {
namespace {

constexpr int kMostDevices = 6;
constexpr int kMostUsbDevices = 3;

struct KindRow {
    DeviceKind kind;
    const char* name;
    std::set<int> statuses;
    bool isSureOfQueue;
};

// 255: it cannot be set up, or it is no device and there is no other. 1: its driver is missing, and nobody
// here offers to install one; 241, where there is a scanner too, with which none is offered.
const std::array kKinds{
    KindRow{DeviceKind::Good, "good", {0}, true},
    KindRow{DeviceKind::Slow, "slow", {0}, true},
    KindRow{DeviceKind::Broken, "broken", {255}, false},
    KindRow{DeviceKind::Moody, "moody", {0}, true},
    KindRow{DeviceKind::Vanishing, "vanishing", {255}, false},
    KindRow{DeviceKind::Usb, "USB", {0}, true},
    KindRow{DeviceKind::Unplugged, "unplugged", {0, 1, 241, 255}, false},
    KindRow{DeviceKind::Mute, "mute", {0, 255}, false},
    KindRow{DeviceKind::Scanner, "scanner", {0}, true},
};

// The print system's own statuses, no name without the list of queues, and no driver without the catalogue.
const std::set<int> kDisturbanceStatuses{0, 1, 69, 73, 148, 241, 255};

constexpr std::array kEvents{"", "scheduler frozen", "scheduler restarted", "scheduler killed"};

constexpr std::array kQuickFaults{Fault::html,          Fault::garbage,  Fault::garbledIpp,
                                  Fault::halfThenClose, Fault::notFound, Fault::unauthorized,
                                  Fault::closeAtOnce,   Fault::redirect, Fault::noAttributes};
constexpr std::array kLastingFaults{Fault::silent, Fault::drip, Fault::garbageThenSilence,
                                    Fault::halfThenSilence};

const KindRow& rowOf(DeviceKind kind) {
    return *std::ranges::find(kKinds, kind, &KindRow::kind);
}

class Lot {
public:
    Lot(std::uint64_t seed, int round) : engine_(seed * 1'000'003 + static_cast<std::uint64_t>(round)) {}

    int upTo(int most) { return static_cast<int>(engine_() % static_cast<std::uint64_t>(most + 1)); }
    bool oneIn(int count) { return upTo(count - 1) == 0; }
    std::chrono::milliseconds milliseconds(int most) { return std::chrono::milliseconds(upTo(most)); }

    template <class Table>
    auto oneOf(const Table& table) {
        return table[static_cast<std::size_t>(upTo(static_cast<int>(std::size(table)) - 1))];
    }

private:
    std::mt19937_64 engine_;
};

PlannedDevice drawDevice(Lot& lot, Place place) {
    PlannedDevice device;
    do
        device.kind = lot.oneOf(kKinds).kind;
    while (place == Place::InProcess && (isUsb(device.kind) || device.kind == DeviceKind::Scanner));
    if (device.kind == DeviceKind::Broken || device.kind == DeviceKind::Moody)
        device.fault = lot.oneOf(kQuickFaults);
    else if (device.kind == DeviceKind::Vanishing)
        device.fault = lot.oneOf(kLastingFaults);
    if (device.kind == DeviceKind::Slow || device.kind == DeviceKind::Vanishing)
        device.moment = lot.milliseconds(500);
    else if (device.kind == DeviceKind::Unplugged)
        device.moment = lot.milliseconds(100);
    return device;
}

}  // namespace

RoundPlan RoundPlan::draw(std::uint64_t seed, int round) {
    Lot lot(seed, round);
    RoundPlan plan;
    plan.place = lot.oneIn(5) ? Place::InProcess : Place::Program;
    for (int more = 1 + lot.upTo(kMostDevices - 1); more > 0; --more)
        if (const auto device = drawDevice(lot, plan.place);
            !isUsb(device.kind) || std::ranges::count_if(plan.devices, [](const auto& each) {
                                       return isUsb(each.kind);
                                   }) < kMostUsbDevices)
            plan.devices.push_back(device);
    if (lot.oneIn(2)) {
        plan.event = static_cast<SchedulerEvent>(lot.upTo(static_cast<int>(kEvents.size()) - 1));
        plan.eventMoment = lot.milliseconds(150);
        plan.eventLength = lot.milliseconds(400);
    }
    return plan;
}

std::string RoundPlan::description() const {
    std::string text = place == Place::InProcess ? "in process:" : "";
    for (const auto& device : devices)
        text += std::string(text.empty() ? "" : " ") + rowOf(device.kind).name;
    if (isDisturbed())
        text += std::string(", ") + kEvents[static_cast<std::size_t>(event)];
    return text;
}

bool isUsb(DeviceKind kind) {
    return kind == DeviceKind::Usb || kind == DeviceKind::Unplugged || kind == DeviceKind::Mute;
}

bool isSureOfQueue(DeviceKind kind) {
    return rowOf(kind).isSureOfQueue;
}

const std::set<int>& statusesOf(DeviceKind kind) {
    return rowOf(kind).statuses;
}

const std::set<int>& statusesOfDisturbance() {
    return kDisturbanceStatuses;
}

}  // namespace ventras
