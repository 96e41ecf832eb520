#pragma once

#include <functional>
#include <memory>

namespace ventras {

class AuthorizationService;
class ComputerName;
class ImageDeviceBrowser;
class Log;
class NotificationBroadcast;
class PredicateInstallController;
class PreferenceStore;
class PrintSystemService;
class PrintToolAgentChannel;
class ProcessTable;
class ResourceBundle;
class RunLoop;
class StringTable;
class UsbRegistry;

/// Everything that the agent needs from the world. It owns nothing; what it names outlives whoever holds it.
struct Platform {
    RunLoop& runLoop;
    Log& log;
    AuthorizationService& authorization;
    PrintSystemService& printSystem;
    ProcessTable& processes;
    ComputerName& computerName;
    ResourceBundle& resources;
    StringTable& strings;
    PreferenceStore& preferences;
    NotificationBroadcast& notifications;
    PrintToolAgentChannel& printToolAgent;
    PredicateInstallController& installer;
    UsbRegistry& usb;
    std::function<std::unique_ptr<ImageDeviceBrowser>()> makeImageDeviceBrowser;
};

}  // namespace ventras
