#pragma once

#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "tests/agent/Agent.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/UsbBench.h"
#include "tests/soak/RoundPlan.h"
#include "tests/soak/Workshop.h"

namespace ventras {

/// What a round came to.
struct RoundResult {
    int status = 0;  ///< the agent's exit status; in process, the last one that is no success
    std::vector<std::string> objections;  ///< what did not hold; none = all is well
    std::string story;                    ///< what the agent said
};

/// One round in the workshop: devices are attached, the agent runs while things happen, what is left is
/// looked at, and everything is taken away again. Use it once, on one thread.
class RoundRun {
public:
    RoundRun(Workshop& workshop, const RoundPlan& plan, int round);

    RoundResult run();

private:
    struct Device {
        PlannedDevice plan;
        std::string argument;  ///< for the agent
        std::string uri;       ///< of its queue
        std::string usbPlace = {};
        std::unique_ptr<ScriptedPrinter> printer = {};
    };

    Device attach(const PlannedDevice& plan);
    Device attachUsb(const PlannedDevice& plan);
    void planEvents();
    void planSchedulerEvents();
    void happenUntilEnd(const std::function<bool(std::chrono::milliseconds)>& hasEndedWithin);
    void runProgram();
    void runInProcess();
    void checkStatus(int status, std::set<int> allowed, bool mayBeWell);
    void checkQueues();
    void checkQueue(const std::string& queue);
    void checkRemains();
    void object(std::string objection) { result_.objections.push_back(std::move(objection)); }

    Environment environment() const;

    Workshop& workshop_;
    const RoundPlan& plan_;
    int round_;
    std::unique_ptr<UsbBench>
        usb_;  ///< for the agent as a program; each bench keeps some descriptors for good
    Agent agent_{environment(), std::nullopt};
    std::vector<Device> devices_;
    std::multimap<std::chrono::milliseconds, std::function<void()>> events_;
    RoundResult result_;
};

}  // namespace ventras
