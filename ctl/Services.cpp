#include "ctl/Services.h"

#include "ctl/Complaint.h"

namespace ventras {
namespace {

Platform harmless(const Platform& real, Log& log, PrintSystemService& printSystem) {
    return {.runLoop = real.runLoop,
            .log = log,
            .authorization = real.authorization,
            .printSystem = printSystem,
            .processes = real.processes,
            .computerName = real.computerName,
            .resources = real.resources,
            .strings = real.strings,
            .preferences = real.preferences,
            .notifications = real.notifications,
            .printToolAgent = real.printToolAgent,
            .installer = real.installer,
            .usb = real.usb,
            .makeImageDeviceBrowser = real.makeImageDeviceBrowser};
}

}  // namespace

void ConsoleLog::error(const std::string& line) {
    complain(line);
}

Services::Services()
    : printSystem_(linux_.platform().printSystem),
      platform_(harmless(linux_.platform(), log_, printSystem_)),
      drivers_(platform_) {}

}  // namespace ventras
