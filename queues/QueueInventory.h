#pragma once

#include <filesystem>
#include <optional>
#include <string>

#include "devices/QueueRecord.h"

namespace ventras {

struct Platform;

/// Knows which queues the local print server has. It keeps nothing: every call asks anew. Any thread may
/// call.
class QueueInventory {
public:
    /// The print server's own list, which is trusted while the scheduler is down.
    static constexpr const char* kSavedList = "/Library/Preferences/org.cups.printers.plist";

    explicit QueueInventory(Platform& platform, std::filesystem::path savedList = kSavedList);

    /// The queues for devices, in the server's order; absent when there are none, or nobody to ask.
    std::optional<QueueRecords> existingQueues() const;

    /// The first queue whose device URI is exactly `deviceURI`: its name, "" when it has none. Absent = no
    /// queue.
    std::optional<std::string> findQueueByDeviceURI(const std::string& deviceURI) const;

private:
    Platform& platform_;
    std::filesystem::path savedList_;
};

}  // namespace ventras
