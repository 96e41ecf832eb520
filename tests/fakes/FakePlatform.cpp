#include "tests/fakes/FakePlatform.h"

namespace ventras {
namespace {

class FakeImageDeviceBrowser final : public ImageDeviceBrowser {
public:
    explicit FakeImageDeviceBrowser(FakeImageDevices& known) : known_(known) { ++known_.browsers; }

    void setDelegate(Delegate*) override {}
    void setBrowsedDeviceTypeMask(std::uint64_t mask) override { known_.mask = mask; }
    std::uint64_t browsedDeviceTypeMask() const override { return known_.mask; }
    void start() override { ++known_.started; }
    std::vector<ImageDevice> devices() const override { return known_.devices; }
    void announceNewSoftwareInstalled() override { ++known_.announcements; }

private:
    FakeImageDevices& known_;
};

}  // namespace

void FakeLog::error(const std::string& line) {
    const std::lock_guard lock(mutex_);
    lines_.push_back(line);
}

std::vector<std::string> FakeLog::lines() const {
    const std::lock_guard lock(mutex_);
    return lines_;
}

std::int32_t FakeAuthorization::create(std::string_view right) {
    rights.emplace_back(right);
    return status;
}

std::optional<pid_t> FakeProcessTable::processNamed(std::string_view commandName) {
    const auto process = processes.find(commandName);
    return process == processes.end() ? std::nullopt : std::optional{process->second};
}

std::optional<std::string> FakeResources::pathForResource(std::string_view resource,
                                                          std::string_view type) const {
    const auto path = folder / (std::string(resource) + "." + std::string(type));
    return std::filesystem::exists(path) ? std::optional{path.string()} : std::nullopt;
}

std::string FakeStrings::localizedString(std::string_view english) const {
    const auto entry = translations.find(english);
    return entry == translations.end() ? std::string(english) : entry->second;
}

void FakePreferences::setValue(std::string_view domain, std::string_view key, const PropertyValue& value) {
    settings.push_back({std::string(domain), std::string(key), value});
}

void FakeNotifications::post(std::string_view name, const PropertyDictionary& userInfo) {
    posted.emplace_back(name, userInfo);
}

PrintToolAgentReply FakePrintToolAgent::sendCommandSync(std::string_view service, std::int32_t command,
                                                        const PropertyDictionary& arguments) {
    const std::lock_guard lock(mutex_);
    commands.push_back({std::string(service), command, arguments});
    const auto* scanID = findText(arguments, "scanID");
    const auto reply = scanID == nullptr ? replies.end() : replies.find(*scanID);
    return reply == replies.end() ? otherwise : reply->second;
}

void FakeInstaller::startWithPredicate(const std::string& predicate, bool confirm) {
    predicates.push_back(predicate);
    confirmCompletion = confirm;
    if (onStart)
        onStart(*this);
}

FakePlatform::FakePlatform(UsbRegistry* usb)
    : platform{.runLoop = runLoop,
               .log = log,
               .authorization = authorization,
               .printSystem = printSystem,
               .processes = processes,
               .computerName = computerName,
               .resources = resources,
               .strings = strings,
               .preferences = preferences,
               .notifications = notifications,
               .printToolAgent = printToolAgent,
               .installer = installer,
               .usb = usb != nullptr ? *usb : emptyUsb,
               .makeImageDeviceBrowser = [this] {
                   return std::make_unique<FakeImageDeviceBrowser>(imageDevices);
               }} {}

}  // namespace ventras
