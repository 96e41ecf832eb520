#pragma once

#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/AuthorizationService.h"
#include "platform/ComputerName.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/Log.h"
#include "platform/NotificationBroadcast.h"
#include "platform/Platform.h"
#include "platform/PredicateInstallController.h"
#include "platform/PreferenceStore.h"
#include "platform/PrintToolAgentChannel.h"
#include "platform/ProcessTable.h"
#include "platform/ResourceBundle.h"
#include "platform/RunLoop.h"
#include "platform/StringTable.h"
#include "tests/fakes/EmptyUsbRegistry.h"
#include "tests/fakes/FakePrintSystem.h"

namespace ventras {

/// Keeps the lines it was given. Any thread may write.
class FakeLog final : public Log {
public:
    void error(const std::string& line) override;
    std::vector<std::string> lines() const;

private:
    mutable std::mutex mutex_;
    std::vector<std::string> lines_;
};

class FakeAuthorization final : public AuthorizationService {
public:
    std::int32_t status = 0;
    std::vector<std::string> rights;
    std::int32_t create(std::string_view right) override;
};

class FakeProcessTable final : public ProcessTable {
public:
    std::map<std::string, pid_t, std::less<>> processes{{"cupsd", 4711}};
    std::optional<pid_t> processNamed(std::string_view commandName) override;
};

class FakeComputerName final : public ComputerName {
public:
    std::optional<std::string> value = "Reading Room";
    std::optional<std::string> computerName() override { return value; }
};

/// Resources by "name.type"; by default those of the source tree's data folder.
class FakeResources final : public ResourceBundle {
public:
    std::filesystem::path folder = VENTRAS_SOURCE_DATA_DIR;
    std::string name() const override { return "TestResources"; }
    std::optional<std::string> pathForResource(std::string_view name, std::string_view type) const override;
};

class FakeStrings final : public StringTable {
public:
    std::map<std::string, std::string, std::less<>> translations;
    std::string localizedString(std::string_view english) const override;
};

class FakePreferences final : public PreferenceStore {
public:
    struct Setting {
        std::string domain, key;
        PropertyValue value;
    };
    std::vector<Setting> settings;
    void setValue(std::string_view domain, std::string_view key, const PropertyValue& value) override;
};

class FakeNotifications final : public NotificationBroadcast {
public:
    std::vector<std::pair<std::string, PropertyDictionary>> posted;
    void post(std::string_view name, const PropertyDictionary& userInfo) override;
};

/// Answers by the "scanID" asked for. Any thread may send.
class FakePrintToolAgent final : public PrintToolAgentChannel {
public:
    struct Command {
        std::string service;
        std::int32_t command;
        PropertyDictionary arguments;
    };
    std::map<std::string, PrintToolAgentReply, std::less<>> replies;
    PrintToolAgentReply otherwise{1, {}};
    std::vector<Command> commands;
    PrintToolAgentReply sendCommandSync(std::string_view service, std::int32_t command,
                                        const PropertyDictionary& arguments) override;

private:
    std::mutex mutex_;
};

/// Records what it is told; `onStart` plays the user and the installer.
class FakeInstaller final : public PredicateInstallController {
public:
    PredicateInstallDelegate* delegate = nullptr;
    std::optional<PredicateInstallSettings> settings;
    std::optional<std::string> title;
    PropertyDictionary installedPrinters;
    std::vector<std::string> predicates;
    std::optional<bool> confirmCompletion;
    std::function<void(FakeInstaller&)> onStart;

    void setDelegate(PredicateInstallDelegate* newDelegate) override { delegate = newDelegate; }
    void configure(const PredicateInstallSettings& newSettings) override { settings = newSettings; }
    void setTitle(const std::string& newTitle) override { title = newTitle; }
    void setInstalledPrintersList(const PropertyDictionary& printers) override {
        installedPrinters = printers;
    }
    void startWithPredicate(const std::string& predicate, bool confirm) override;
};

/// What the browsers of a FakePlatform know and were told; outlives them.
struct FakeImageDevices {
    std::vector<ImageDevice> devices;
    std::uint64_t mask = 0;
    int browsers = 0;
    int started = 0;
    int announcements = 0;
};

/// Every service in memory, bundled.
struct FakePlatform {
    RunLoop runLoop;
    FakeLog log;
    FakeAuthorization authorization;
    FakePrintSystem printSystem;
    FakeProcessTable processes;
    FakeComputerName computerName;
    FakeResources resources;
    FakeStrings strings;
    FakePreferences preferences;
    FakeNotifications notifications;
    FakePrintToolAgent printToolAgent;
    FakeInstaller installer;
    EmptyUsbRegistry emptyUsb;
    FakeImageDevices imageDevices;
    Platform platform;

    /// @param usb in place of a USB without devices; outlives this
    explicit FakePlatform(UsbRegistry* usb = nullptr);
};

}  // namespace ventras
