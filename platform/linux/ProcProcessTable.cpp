#include "platform/linux/ProcProcessTable.h"

#include <charconv>
#include <fstream>
#include <string>
#include <system_error>

namespace ventras {
namespace {

std::optional<pid_t> processNumber(const std::string& name) {
    pid_t number = 0;
    const auto* end = name.data() + name.size();
    const auto [stop, error] = std::from_chars(name.data(), end, number);
    return error == std::errc{} && stop == end && number > 0 ? std::optional{number} : std::nullopt;
}

// Empty for a process that ended meanwhile.
std::string commandNameOf(const std::filesystem::path& process) {
    std::string name;
    std::ifstream file(process / "comm");
    std::getline(file, name);
    return name;
}

}  // namespace

std::optional<pid_t> ProcProcessTable::processNamed(std::string_view commandName) {
    if (commandName.empty())
        return std::nullopt;
    std::error_code error;
    for (std::filesystem::directory_iterator entry(folder_, error), end; !error && entry != end;
         entry.increment(error)) {
        const auto number = processNumber(entry->path().filename());
        if (number && commandNameOf(entry->path()) == commandName)
            return number;
    }
    return std::nullopt;
}

}  // namespace ventras
