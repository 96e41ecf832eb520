#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/QueueAttributes.h"
#include "queues/QueueStatus.h"

namespace ventras {

class QueueInventory;
class VentrasPrinterObject;
struct Platform;

/// What became of one creation.
struct QueueCreationResult {
    std::int32_t status = 0;
    std::optional<std::string> queueID;  ///< the new queue, or the one that already serves the device
};

/// What happens to the default printer when a queue is made.
enum class DefaultPrinter { Keep, BecomesNewQueue };

/// Makes queues on the local print server, one at a time in this process. Any thread may call; calls block.
class QueueCreation {
public:
    QueueCreation(Platform& platform, const QueueInventory& inventory);

    /// Makes one queue; a failure leaves none behind.
    ///
    /// A USB device is guarded against other processes by a file "/tmp/URI" that is made exclusively; the
    /// name is fixed because every process must arrive at the same one.
    /// @param location text for people; absent = none
    /// @param attributes with "Printer URI"
    /// @param device gives the name
    QueueCreationResult createQueue(const std::optional<std::string>& location,
                                    const QueueAttributes& attributes, DefaultPrinter defaultPrinter,
                                    VentrasPrinterObject& device) const;

private:
    QueueCreationResult createUnderLock(const QueueAttributes& attributes, const std::string& displayName,
                                        DefaultPrinter defaultPrinter) const;

    Platform& platform_;
    const QueueInventory& inventory_;
};

}  // namespace ventras
