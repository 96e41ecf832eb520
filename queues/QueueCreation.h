#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/QueueAttributes.h"

namespace ventras {

class QueueInventory;
class VentrasPrinterObject;
struct Platform;

/// Outcomes of making a queue that are this system's own; every other value is the print system's.
namespace QueueStatus {
inline constexpr std::int32_t kCreated = 0;
inline constexpr std::int32_t kAlreadyExists =
    242;  ///< a queue serves the device, or another process makes it
inline constexpr std::int32_t kNoDriver = 241;
inline constexpr std::int32_t kCannotHandle = 255;
inline constexpr std::int32_t kNoDevice = -1;
inline constexpr std::int32_t kCannotSerialize = -30886;  ///< or the local server's address is not known
inline constexpr std::int32_t kNoIdentifier = -620;
}  // namespace QueueStatus

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
