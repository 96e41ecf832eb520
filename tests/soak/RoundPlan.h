#pragma once

#include <chrono>
#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "tests/parts/ScriptedReply.h"

namespace ventras {

/// A device of a round, and what is wrong with it.
enum class DeviceKind {
    Good,       ///< a network printer
    Slow,       ///< one that thinks before each answer
    Broken,     ///< one that answers nonsense
    Moody,      ///< one that answers nonsense from the second question on
    Vanishing,  ///< one that says nothing, or half of it, and is switched off
    Usb,        ///< a USB printer with a driver
    Unplugged,  ///< one that is pulled out meanwhile
    Mute,       ///< one that does not tell what it is
    Scanner,    ///< a scanner's description
};

struct PlannedDevice {
    DeviceKind kind = DeviceKind::Good;
    Fault fault = Fault::none;
    std::chrono::milliseconds moment{};  ///< of a network printer's answers, or of its end, or of a USB one's
};

/// What happens to the scheduler meanwhile.
enum class SchedulerEvent { None, Frozen, Restarted, Killed };

/// Whether the agent runs as a program, or its queue making within the soak itself.
enum class Place { Program, InProcess };

/// One round: everything about it that is drawn by lot.
struct RoundPlan {
    Place place = Place::Program;
    std::vector<PlannedDevice> devices;
    SchedulerEvent event = SchedulerEvent::None;
    std::chrono::milliseconds eventMoment{};
    std::chrono::milliseconds eventLength{};

    /// The plan of a round; the same for the same numbers.
    static RoundPlan draw(std::uint64_t seed, int round);

    /// One line for people.
    std::string description() const;

    bool isDisturbed() const { return event != SchedulerEvent::None; }
};

bool isUsb(DeviceKind kind);

/// Whether a device of the kind must get its queue, when nothing happens to the scheduler.
bool isSureOfQueue(DeviceKind kind);

/// The exit statuses that a device may bring about, as a program's, when nothing happens to the scheduler.
const std::set<int>& statusesOf(DeviceKind kind);

/// Those that it may bring about besides when something does.
const std::set<int>& statusesOfDisturbance();

}  // namespace ventras
