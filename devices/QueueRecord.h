#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace ventras {

/// One existing queue of the local print server. The scheduler's records are complete; those of the saved
/// list are taken as they stand.
struct QueueRecord {
    std::optional<std::string> printerName;   ///< "printer-name"
    std::optional<std::string> deviceURI;     ///< "device-uri": where the queue prints to
    std::optional<std::int64_t> printerType;  ///< "printer-type": the scheduler's bit set

    bool operator==(const QueueRecord&) const = default;
};

using QueueRecords = std::vector<QueueRecord>;

}  // namespace ventras
