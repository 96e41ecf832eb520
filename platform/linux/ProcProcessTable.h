#pragma once

#include <filesystem>

#include "platform/ProcessTable.h"

namespace ventras {

/// The processes as procfs shows them (proc(5)). Any thread may ask.
class ProcProcessTable : public ProcessTable {
public:
    /// @param folder where procfs is mounted
    explicit ProcProcessTable(std::filesystem::path folder = "/proc") : folder_(std::move(folder)) {}

    std::optional<pid_t> processNamed(std::string_view commandName) override;

private:
    std::filesystem::path folder_;
};

}  // namespace ventras
