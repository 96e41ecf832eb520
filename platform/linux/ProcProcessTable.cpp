#include "platform/linux/ProcProcessTable.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <charconv>
#include <memory>
#include <system_error>

#include "platform/linux/FileDescriptor.h"

namespace ventras {
namespace {

constexpr std::size_t kLongestName = 64;  // the kernel's own threads have names longer than anybody else's

struct CloseFolder {
    void operator()(DIR* folder) const { closedir(folder); }
};
using FolderPtr = std::unique_ptr<DIR, CloseFolder>;

std::optional<pid_t> processNumber(std::string_view name) {
    pid_t number = 0;
    const auto* end = name.data() + name.size();
    const auto [stop, error] = std::from_chars(name.data(), end, number);
    return error == std::errc{} && stop == end && number > 0 ? std::optional{number} : std::nullopt;
}

// Not for a process that ended meanwhile.
bool isCalled(int folder, pid_t process, std::string_view commandName) {
    const auto path = std::to_string(process) + "/comm";
    const FileDescriptor file(openat(folder, path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file.get() < 0)
        return false;
    std::array<char, kLongestName + 1> text;
    const auto length = read(file.get(), text.data(), text.size());
    const std::string_view line(text.data(), length > 0 ? static_cast<std::size_t>(length) : 0);
    return line.substr(0, line.find('\n')) == commandName;
}

std::optional<pid_t> search(DIR* folder, std::string_view commandName) {
    while (const auto* entry = readdir(folder))
        if (const auto number = processNumber(entry->d_name);
            number && isCalled(dirfd(folder), *number, commandName))
            return number;
    return std::nullopt;
}

}  // namespace

std::optional<pid_t> ProcProcessTable::processNamed(std::string_view commandName) {
    if (commandName.empty())
        return std::nullopt;
    const FolderPtr folder{opendir(folder_.c_str())};
    if (!folder)
        return std::nullopt;
    if (const auto last = lastPlaceOf(commandName); last && isCalled(dirfd(folder.get()), *last, commandName))
        return last;
    const auto found = search(folder.get(), commandName);
    if (found)
        remember(commandName, *found);
    return found;
}

std::optional<pid_t> ProcProcessTable::lastPlaceOf(std::string_view commandName) {
    const std::lock_guard lock(mutex_);
    const auto place = lastPlaces_.find(commandName);
    return place == lastPlaces_.end() ? std::nullopt : std::optional{place->second};
}

void ProcProcessTable::remember(std::string_view commandName, pid_t number) {
    const std::lock_guard lock(mutex_);
    lastPlaces_.insert_or_assign(std::string(commandName), number);
}

}  // namespace ventras
