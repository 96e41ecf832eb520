#pragma once

#include <string>

#include "ctl/DryRunPrintSystem.h"
#include "drivers/PPDManager.h"
#include "platform/Log.h"
#include "platform/Platform.h"
#include "platform/linux/LinuxPlatform.h"

namespace ventras {

/// Says on standard error what the agent would write to the system log.
class ConsoleLog final : public Log {
public:
    void error(const std::string& line) override;
};

/// This machine's services for commands that look at devices and at the print system: as the agent has them,
/// but without a way to change anything. Main thread only.
class Services {
public:
    Services();
    Services(const Services&) = delete;
    Services& operator=(const Services&) = delete;

    Platform& platform() { return platform_; }
    PPDManager& drivers() { return drivers_; }
    DryRunPrintSystem& printSystem() { return printSystem_; }

private:
    LinuxPlatform linux_;
    ConsoleLog log_;
    DryRunPrintSystem printSystem_;
    Platform platform_;
    PPDManager drivers_;
};

}  // namespace ventras
