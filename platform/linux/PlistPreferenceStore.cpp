#include "platform/linux/PlistPreferenceStore.h"

#include <fcntl.h>
#include <pwd.h>
#include <sys/file.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <string>
#include <system_error>
#include <thread>

#include "platform/Deadline.h"
#include "platform/FileContent.h"
#include "platform/Log.h"
#include "platform/PropertyList.h"
#include "platform/linux/FileDescriptor.h"

namespace ventras {
namespace {

constexpr auto kLockLimit = std::chrono::seconds(1);
constexpr auto kLockRetry = std::chrono::milliseconds(10);

std::filesystem::path home() {
    if (const char* folder = std::getenv("HOME"); folder != nullptr && *folder == '/')
        return folder;
    std::array<char, 4096> buffer{};
    passwd entry{};
    passwd* found = nullptr;
    if (getpwuid_r(getuid(), &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr)
        return {};
    return found->pw_dir;
}

std::filesystem::path pathOf(const std::filesystem::path& folder, std::string_view domain) {
    return folder / (std::string(domain) + ".plist");
}

struct Stored {
    bool readable = true;
    PropertyDictionary values;
};

Stored read(const std::filesystem::path& path) {
    const auto text = fileContent(path);
    if (!text)
        return {};
    auto list = parsePropertyList(*text);
    if (auto* values = list ? std::get_if<PropertyDictionary>(&*list) : nullptr)
        return {true, std::move(*values)};
    return {false, {}};
}

// Agents of the same user may run at the same time; the lock is on the folder, so it leaves no file behind.
FileDescriptor lockFolder(const std::filesystem::path& folder) {
    FileDescriptor descriptor{open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)};
    const auto deadline = Deadline::after(kLockLimit);
    while (descriptor.get() >= 0 && flock(descriptor.get(), LOCK_EX | LOCK_NB) != 0) {
        if (errno != EWOULDBLOCK || deadline.passed())
            return {};
        std::this_thread::sleep_for(kLockRetry);
    }
    return descriptor;
}

bool replace(const std::filesystem::path& path, std::string_view text) {
    std::string temporary = path.string() + ".XXXXXX";
    const FileDescriptor descriptor{mkostemp(temporary.data(), O_CLOEXEC)};
    if (descriptor.get() < 0)
        return false;
    if (writeAll(descriptor.get(), text) && fsync(descriptor.get()) == 0 &&
        rename(temporary.c_str(), path.c_str()) == 0)
        return true;
    unlink(temporary.c_str());
    return false;
}

// Empty on success, else what could not be done.
std::string store(const std::filesystem::path& folder, std::string_view domain, std::string_view key,
                  const PropertyValue& value) {
    std::error_code error;
    std::filesystem::create_directories(folder, error);
    const auto lock = lockFolder(folder);
    if (lock.get() < 0)
        return "the folder cannot be locked";
    const auto path = pathOf(folder, domain);
    auto stored = read(path);
    if (!stored.readable)
        std::filesystem::rename(path, path.string() + ".bad", error);
    stored.values.insert_or_assign(std::string(key), value);
    const auto text = xmlPropertyList(stored.values);
    if (!text)
        return "the value cannot stand in a property list";
    return replace(path, *text) ? "" : std::generic_category().message(errno);
}

}  // namespace

std::filesystem::path userConfigurationFolder() {
    // A relative path in the variable is to be ignored.
    if (const char* folder = std::getenv("XDG_CONFIG_HOME"); folder != nullptr && *folder == '/')
        return folder;
    const auto folder = home();
    return folder.empty() ? folder : folder / ".config";
}

void PlistPreferenceStore::setValue(std::string_view domain, std::string_view key,
                                    const PropertyValue& value) {
    const auto failure = folder_.empty() ? "there is no home folder" : store(folder_, domain, key, value);
    if (!failure.empty())
        log_.error("preference \"" + std::string(key) + "\" of " + std::string(domain) +
                   " is not stored: " + failure);
}

std::optional<PropertyValue> PlistPreferenceStore::value(std::string_view domain,
                                                         std::string_view key) const {
    const auto stored = read(pathOf(folder_, domain));
    const auto entry = stored.values.find(key);
    return entry == stored.values.end() ? std::nullopt : std::optional{entry->second};
}

}  // namespace ventras
