#pragma once

#include <sys/types.h>

#include <optional>
#include <string_view>

namespace ventras {

/// The processes of this system, those of every user. Any thread may ask.
class ProcessTable {
public:
    virtual ~ProcessTable() = default;

    /// The process whose command name is exactly `commandName`; absent when there is none, or when the table
    /// cannot be read.
    virtual std::optional<pid_t> processNamed(std::string_view commandName) = 0;
};

}  // namespace ventras
