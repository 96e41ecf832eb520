#pragma once

#include "platform/Platform.h"
#include "platform/RunLoop.h"
#include "platform/linux/DataFolder.h"
#include "platform/linux/GettextStringTable.h"
#include "platform/linux/PlistPreferenceStore.h"
#include "platform/linux/ProcProcessTable.h"
#include "platform/linux/Syslog.h"
#include "platform/linux/desktop/DBusNotificationBroadcast.h"
#include "platform/linux/desktop/DBusPrintToolAgentChannel.h"
#include "platform/linux/desktop/LinuxComputerName.h"
#include "platform/linux/desktop/PolkitAuthorization.h"
#include "platform/linux/installer/LinuxPredicateInstallController.h"
#include "platform/linux/scheduler/CupsPrintSystem.h"
#include "platform/linux/usb/LibusbRegistry.h"

namespace ventras {

/// The services of a Linux desktop, each asleep until it is used: nothing here connects to anything by
/// itself. Construct it on the main thread, before other threads start; it outlives whoever holds its
/// platform().
class LinuxPlatform {
public:
    LinuxPlatform();
    LinuxPlatform(const LinuxPlatform&) = delete;
    LinuxPlatform& operator=(const LinuxPlatform&) = delete;

    Platform& platform() { return platform_; }

private:
    RunLoop runLoop_;
    Syslog log_;
    PolkitAuthorization authorization_;
    PlistPreferenceStore preferences_;
    CupsPrintSystem printSystem_;
    ProcProcessTable processes_;
    LinuxComputerName computerName_;
    DataFolder resources_;
    GettextStringTable strings_;
    DBusNotificationBroadcast notifications_;
    DBusPrintToolAgentChannel printToolAgent_;
    LinuxPredicateInstallController installer_;
    LibusbRegistry usb_;
    Platform platform_;
};

}  // namespace ventras
