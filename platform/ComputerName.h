#pragma once

#include <optional>
#include <string>

namespace ventras {

/// The name by which its users know this computer. Any thread may ask.
class ComputerName {
public:
    virtual ~ComputerName() = default;

    /// UTF-8; absent when the computer has none.
    virtual std::optional<std::string> computerName() = 0;
};

}  // namespace ventras
