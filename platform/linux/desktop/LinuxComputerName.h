#pragma once

#include <filesystem>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "platform/ComputerName.h"

namespace ventras {

/// The name from the host-name service (hostnamed), its file machine-info(5), or the kernel; looked up once.
///
/// The service is asked only where it runs already: it reads the same file, and starting it takes longer than
/// making a queue. Any thread may ask.
class LinuxComputerName : public ComputerName {
public:
    /// @param folder of the files "machine-info" and "hostname"
    explicit LinuxComputerName(std::filesystem::path folder = "/etc") : folder_(std::move(folder)) {}

    std::optional<std::string> computerName() override;

private:
    std::filesystem::path folder_;
    std::once_flag looked_;
    std::optional<std::string> name_;
};

/// The value of `key` in a file of shell-like assignments such as machine-info(5) and os-release(5), its
/// quotes and backslashes resolved; absent when there is none, or an empty one.
std::optional<std::string> shellAssignment(std::string_view file, std::string_view key);

}  // namespace ventras
