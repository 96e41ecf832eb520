#pragma once

#include <filesystem>
#include <map>
#include <mutex>
#include <string>

#include "platform/ProcessTable.h"

namespace ventras {

/// The processes as procfs shows them (proc(5)). Any thread may ask.
///
/// Looking at hundreds of processes takes as long as asking the scheduler something does, and the same name
/// is asked for again and again: where a process was found, it is looked for first.
class ProcProcessTable : public ProcessTable {
public:
    /// @param folder where procfs is mounted
    explicit ProcProcessTable(std::filesystem::path folder = "/proc") : folder_(std::move(folder)) {}

    std::optional<pid_t> processNamed(std::string_view commandName) override;

private:
    std::optional<pid_t> lastPlaceOf(std::string_view commandName);
    void remember(std::string_view commandName, pid_t number);

    std::filesystem::path folder_;
    std::mutex mutex_;
    std::map<std::string, pid_t, std::less<>> lastPlaces_;
};

}  // namespace ventras
