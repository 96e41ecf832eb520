#include "platform/linux/LinuxPlatform.h"

#include <csignal>

#include "platform/linux/scanners/LinuxImageDeviceBrowser.h"

namespace ventras {

LinuxPlatform::LinuxPlatform()
    : preferences_(userConfigurationFolder(), log_),
      printSystem_(log_, preferences_),
      resources_(locateDataFolder()),
      strings_(locateDataFolder().parent_path() / "locale"),
      notifications_(log_),
      installer_(log_, strings_),
      platform_{.runLoop = runLoop_,
                .log = log_,
                .authorization = authorization_,
                .printSystem = printSystem_,
                .processes = processes_,
                .computerName = computerName_,
                .resources = resources_,
                .strings = strings_,
                .preferences = preferences_,
                .notifications = notifications_,
                .printToolAgent = printToolAgent_,
                .installer = installer_,
                .usb = usb_,
                .makeImageDeviceBrowser = [] { return std::make_unique<LinuxImageDeviceBrowser>(); }} {
    // A peer that closes its connection while we write is an error of that call, not the end of the program.
    std::signal(SIGPIPE, SIG_IGN);
}

}  // namespace ventras
