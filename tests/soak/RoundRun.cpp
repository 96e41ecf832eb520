#include "tests/soak/RoundRun.h"

#include <algorithm>
#include <atomic>
#include <filesystem>
#include <thread>

#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDManager.h"
#include "platform/linux/LinuxPlatform.h"
#include "queues/QueueMaker.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/OpenedPpd.h"
#include "tests/soak/Census.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr auto kLimit = 60s;

struct UsbPlace {
    const char* place;
    const char* argument;
};

// Bus and ports, and as one number.
constexpr UsbPlace kUsbPlaces[] = {{"1-4", "-u20971520,0"}, {"1-5", "-u22020096,0"}, {"2-1", "-u34603008,0"}};

std::string guardFile(std::string uri) {
    std::ranges::replace_if(
        uri, [](char c) { return c == '/' || c == '?'; }, '.');
    return "/tmp/" + uri;
}

}  // namespace

RoundRun::RoundRun(Workshop& workshop, const RoundPlan& plan, int round)
    : workshop_(workshop),
      plan_(plan),
      round_(round),
      usb_(plan.place == Place::Program ? std::make_unique<UsbBench>() : nullptr) {}

Environment RoundRun::environment() const {
    return together({workshop_.environment(), usb_ ? usb_->environment() : Environment{}});
}

RoundResult RoundRun::run() {
    if (plan_.event == SchedulerEvent::Killed)
        workshop_.saveQueues();
    const auto before = stateOfQueues(workshop_.scheduler(), {Workshop::kPresent});
    for (const auto& plan : plan_.devices)
        devices_.push_back(attach(plan));
    planEvents();
    if (plan_.place == Place::InProcess)
        runInProcess();
    else
        runProgram();
    checkQueues();
    if (const auto after = stateOfQueues(workshop_.scheduler(), {Workshop::kPresent}); after != before)
        object("somebody else's queue has changed:\n" + after);
    checkRemains();
    for (const auto& queue : workshop_.newQueues())
        workshop_.scheduler().deleteQueue(queue);
    return std::move(result_);
}

RoundRun::Device RoundRun::attach(const PlannedDevice& plan) {
    const auto name = "R" + std::to_string(round_) + "D" + std::to_string(devices_.size());
    if (isUsb(plan.kind))
        return attachUsb(plan);
    if (plan.kind == DeviceKind::Scanner)
        return {plan, "--scanner" + name + ",P," + name + ",/icon,USB,1,2,3", "usb://" + name};
    ScriptedPrinterOptions options{.name = name, .fault = plan.fault};
    if (plan.kind == DeviceKind::Slow)
        options.delay = plan.moment;
    if (plan.kind == DeviceKind::Moody)
        options.healthyRequests = 1;
    auto printer = std::make_unique<ScriptedPrinter>(std::move(options));
    const auto uri = printer->uri();
    return {plan, uri, uri, {}, std::move(printer)};
}

RoundRun::Device RoundRun::attachUsb(const PlannedDevice& plan) {
    const auto number = static_cast<std::size_t>(
        std::ranges::count_if(devices_, [](const Device& device) { return !device.usbPlace.empty(); }));
    const auto& [place, argument] = kUsbPlaces[number];
    const auto serial = std::to_string(round_) + "." + std::to_string(number);
    FakePrinterModel model;
    model.deviceID = "MFG:Acme;MDL:ColorJet;CMD:PDF;SN:" + serial + ";";
    auto& printer = usb_->plugIn(place, std::move(model));
    if (plan.kind == DeviceKind::Mute)
        printer.fault = [](const UsbSetup& setup) {
            return isGetDeviceID(setup) ? std::optional{UsbAnswer::stall()} : std::nullopt;
        };
    return {plan, argument, "usb://Acme/ColorJet?serial=" + serial, place};
}

void RoundRun::planEvents() {
    for (auto& device : devices_) {
        if (device.plan.kind == DeviceKind::Vanishing)
            events_.emplace(device.plan.moment, [&device] { device.printer.reset(); });
        if (device.plan.kind == DeviceKind::Unplugged)
            events_.emplace(device.plan.moment, [this, &device] { usb_->unplug(device.usbPlace); });
    }
    planSchedulerEvents();
}

void RoundRun::planSchedulerEvents() {
    auto& scheduler = workshop_.scheduler();
    const auto end = plan_.eventMoment + plan_.eventLength;
    switch (plan_.event) {
        case SchedulerEvent::None:
            return;
        case SchedulerEvent::Frozen:
            events_.emplace(plan_.eventMoment, [&scheduler] { scheduler.suspend(); });
            events_.emplace(end, [&scheduler] { scheduler.resume(); });
            return;
        case SchedulerEvent::Restarted:
            events_.emplace(plan_.eventMoment, [&scheduler] { scheduler.stop(); });
            break;
        case SchedulerEvent::Killed:
            events_.emplace(plan_.eventMoment, [&scheduler] { scheduler.kill(); });
            break;
    }
    events_.emplace(end, [&scheduler] { scheduler.start(); });
}

// Everything that is planned happens, if need be when it is too late to disturb anybody.
void RoundRun::happenUntilEnd(const std::function<bool(std::chrono::milliseconds)>& hasEndedWithin) {
    const auto began = Clock::now();
    for (const auto& [moment, happen] : events_) {
        hasEndedWithin(std::max(
            0ms, std::chrono::duration_cast<std::chrono::milliseconds>(began + moment - Clock::now())));
        happen();
    }
    if (!hasEndedWithin(kLimit))
        object("it has not ended after a minute");
}

void RoundRun::runProgram() {
    std::vector<std::string> arguments;
    std::set<int> allowed;
    bool mayBeWell = true;
    for (const auto& device : devices_) {
        arguments.push_back(device.argument);
        const auto& statuses = statusesOf(device.plan.kind);
        allowed.insert(statuses.begin(), statuses.end());
        mayBeWell = mayBeWell && statuses.contains(0);
    }
    const auto program = agent_.start(arguments);
    happenUntilEnd([&](std::chrono::milliseconds limit) { return program->waitUntilEnded(limit); });
    const auto run = Agent::resultOf(*program);
    result_.story = run.story();
    result_.status = run.exitStatus;
    if (run.signal != 0)
        object("signal " + std::to_string(run.signal) + " ended it");
    if (isGroupAlive(program->pid()))
        object("a process of its is left");
    checkStatus(run.exitStatus, std::move(allowed), mayBeWell);
    if (plan_.event == SchedulerEvent::None || plan_.event == SchedulerEvent::Frozen) {
        const auto queues = workshop_.newQueues();
        for (const auto& queue : run.queueIDs())
            if (std::ranges::find(queues, queue) == queues.end())
                object("the queue " + queue + " that it made is not there");
    }
}

void RoundRun::runInProcess() {
    LinuxPlatform linuxPlatform;
    PPDManager drivers(linuxPlatform.platform());
    std::vector<std::atomic<int>> statuses(devices_.size());
    std::atomic<std::size_t> ended = 0;
    std::vector<std::jthread> workers;
    for (std::size_t i = 0; i < devices_.size(); ++i)
        workers.emplace_back([&, i, uri = devices_[i].uri] {
            VellumProfilePrinterObject printer(linuxPlatform.platform(), drivers, uri);
            statuses[i] = QueueMaker(linuxPlatform.platform(), drivers).createQueueForDevice(printer) & 0xFF;
            ++ended;
        });
    happenUntilEnd([&](std::chrono::milliseconds limit) {
        return comesTrue([&] { return ended == workers.size(); }, limit);
    });
    workers.clear();
    for (std::size_t i = 0; i < devices_.size(); ++i) {
        const auto& allowed = statusesOf(devices_[i].plan.kind);
        checkStatus(statuses[i], allowed, allowed.contains(0));
        result_.story += devices_[i].uri + ": " + std::to_string(statuses[i]) + "\n";
        if (statuses[i] != 0)
            result_.status = statuses[i];
    }
}

void RoundRun::checkStatus(int status, std::set<int> allowed, bool mayBeWell) {
    if (!mayBeWell)
        allowed.erase(0);
    if (plan_.isDisturbed())
        allowed.insert(statusesOfDisturbance().begin(), statusesOfDisturbance().end());
    if (!allowed.contains(status))
        object("status " + std::to_string(status));
}

void RoundRun::checkQueues() {
    std::set<std::string> served;
    for (const auto& queue : workshop_.newQueues()) {
        checkQueue(queue);
        if (!served.insert(workshop_.scheduler().attribute(queue, "device-uri")).second)
            object("two queues serve the device of " + queue);
    }
    if (plan_.isDisturbed())
        return;
    for (const auto& device : devices_)
        if (isSureOfQueue(device.plan.kind) && !served.contains(device.uri))
            object("no queue serves " + device.uri);
}

void RoundRun::checkQueue(const std::string& queue) {
    const auto& scheduler = workshop_.scheduler();
    const auto uri = scheduler.attribute(queue, "device-uri");
    if (std::ranges::find(devices_, uri, &Device::uri) == devices_.end())
        object(queue + " has a device that is none of the round's: " + uri);
    if (!openedPpd(scheduler.ppd(queue)))
        object(queue + " has no PPD that opens");
    if (scheduler.attribute(queue, "printer-state") != "3" ||
        scheduler.attribute(queue, "printer-is-accepting-jobs") != "true")
        object(queue + " is not ready for jobs");
}

void RoundRun::checkRemains() {
    for (const auto& files : {workshop_.leftovers(), agent_.leftovers()})
        for (const auto& file : files)
            object("the temporary file " + file + " is left");
    for (auto& device : devices_) {
        if (std::filesystem::exists(guardFile(device.uri)))
            object("the guard file of " + device.uri + " is left");
        if (!device.usbPlace.empty() && device.plan.kind != DeviceKind::Unplugged) {
            if (usb_->node(device.usbPlace).openAtPresent() != 0)
                object("the USB device of " + device.uri + " is still open");
            usb_->unplug(device.usbPlace);
        }
    }
    devices_.clear();
}

}  // namespace ventras
